#include "platform/host/device/RequestLog.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>

#include "platform/host/device/Device.h"

namespace host {
namespace {

/// `text` in quotes, on one line, and with no way to look like what stands around it.
std::string quoted(const std::string& text) {
  std::string line = "\"";
  for (const char byte : text) {
    if (byte == '"' || byte == '\\' || byte == '\n') line += '\\';
    line += byte == '\n' ? 'n' : byte;
  }
  return line + '"';
}

std::string describe(const lumo::object& value) {
  if (const auto* const text = value.as<std::string>()) return quoted(*text);
  if (const auto* const flag = value.as<bool>()) return *flag ? "true" : "false";
  if (const auto* const number = value.as<std::int64_t>()) return std::to_string(*number);
  if (const auto* const entries = value.as<lumo::dict>()) return describe(*entries);
  return "null";
}

}  // namespace

std::string describe(const lumo::dict& request) {
  std::string text;
  for (const auto& [key, value] : request.entries()) {
    text += (text.empty() ? "" : ", ") + key + "=" + describe(value);
  }
  return "{" + text + "}";
}

void recordRequest(const std::string& line) {
  const auto& path = device().requestLog;
  if (path.empty()) return;
  const int log = open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0666);
  const std::string whole = line + '\n';
  errno = ENOSPC;  // what a write that is cut short says nothing of
  // One write each, so that lines of several processes never mix.
  if (log < 0 || write(log, whole.data(), whole.size()) != static_cast<ssize_t>(whole.size())) {
    std::fprintf(stderr, "%s: cannot write the request log: %s\n", path.c_str(), strerror(errno));
  }
  if (log >= 0) close(log);
}

}  // namespace host
