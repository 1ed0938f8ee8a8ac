#include "platform/host/device/Answers.h"

#include <array>
#include <chrono>
#include <cstdio>
#include <ctime>

namespace host {

TelephonyLumo::Result answerWith(const Answer& answer, std::string_view key, std::string value,
                                 lumo::object* reply) {
  lumo::dict entries;
  switch (answer.kind) {
    case Answer::Kind::error:
      return {answer.code, "the device profile makes this request fail"};
    case Answer::Kind::nullReply:
      *reply = {};
      return {};
    case Answer::Kind::emptyReply:
      break;
    case Answer::Kind::value:
      entries.set(key, std::move(value));
      break;
  }
  *reply = std::move(entries);
  return {};
}

std::string timestampOr(const std::optional<std::string>& given) {
  if (given) return *given;
  using namespace std::chrono;
  const auto now = system_clock::now();
  const std::time_t seconds = system_clock::to_time_t(now);
  std::tm local{};
  localtime_r(&seconds, &local);
  std::array<char, 32> text{};
  const auto length = std::strftime(text.data(), text.size(), "%Y-%m-%d-%H-%M-%S-", &local);
  const auto milliseconds = duration_cast<std::chrono::milliseconds>(now.time_since_epoch()) % 1s;
  std::snprintf(text.data() + length, text.size() - length, "%03d",
                static_cast<int>(milliseconds.count()));
  return text.data();
}

}  // namespace host
