#include "platform/host/device/RequestLog.h"

#include <unistd.h>

#include <cerrno>
#include <system_error>

#include "platform/host/device/Device.h"
#include "platform/posix/files.h"
#include "platform/posix/transfer.h"

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

std::error_code appendLine(const std::string& path, const std::string& line) {
  constexpr mode_t kForAll = 0666;  // less the process's file mode creation mask
  const auto log = posix::openForAppending(path, kForAll);
  if (!log) return {errno, std::generic_category()};
  return posix::writeAll(log.get(), line + '\n');  // at once: lines of several processes never mix
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
  const auto failure = appendLine(path, line);
  if (!failure) return;
  const auto why = path + ": cannot write the request log: " + failure.message() + "\n";
  static_cast<void>(posix::writeAll(STDERR_FILENO, why));
}

}  // namespace host
