#include "platform/host/device/Requests.h"

#include <cerrno>
#include <cstdio>
#include <ctime>
#include <system_error>

#include "platform/host/device/Device.h"
#include "platform/posix/Descriptor.h"

namespace host {
namespace {

/// `text` in quotation marks, on one line, so that it cannot be taken for what stands around it.
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
  constexpr mode_t kForAll = 0666;  // less the umask
  const auto& path = device().requestLog;
  if (path.empty()) return;
  const auto log = posix::openForAppending(path, kForAll);
  std::error_code failure(errno, std::generic_category());
  if (log)
    failure = posix::writeAll(log.get(), line + '\n');  // with one write: processes may share it
  if (failure) complain(path + ": cannot write the request log: " + failure.message());
}

TelephonyLumo::Result answerWith(const Answer& answer, std::string_view key, std::string value,
                                 lumo::object* reply) {
  using Kind = Answer::Kind;
  if (answer.kind == Kind::error)
    return {answer.code, "the device profile makes this request fail"};
  lumo::dict entries;
  if (answer.kind == Kind::value) entries.set(key, std::move(value));
  *reply = answer.kind == Kind::nullReply ? lumo::object() : lumo::object(std::move(entries));
  return {};
}

std::string timestampOr(const std::optional<std::string>& given) {
  if (given) return *given;
  std::timespec now{};
  ::clock_gettime(CLOCK_REALTIME, &now);
  std::tm local{};
  ::localtime_r(&now.tv_sec, &local);
  char text[32];
  const auto length = std::strftime(text, sizeof text, "%Y-%m-%d-%H-%M-%S-", &local);
  std::snprintf(text + length, sizeof text - length, "%03d",
                static_cast<int>(now.tv_nsec / 1'000'000));
  return text;
}

}  // namespace host
