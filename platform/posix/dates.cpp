#include <array>
#include <chrono>
#include <cmath>
#include <ctime>
#include <limits>

#include "platform/oslog_store.h"

namespace {

constexpr std::int64_t kMicrosecondsASecond = 1'000'000;

std::int64_t wholeSeconds(OSLogDate date) {
  const std::chrono::microseconds since(date.microsecondsSince1970());
  return std::chrono::floor<std::chrono::seconds>(since).count();
}

/// The text of a date to the second, with room for the longest year that a date can have.
struct DateText {
  std::array<char, sizeof "-290308-MM-DD HH:MM:SS +0000"> text{};
  std::size_t length = 0;
};

DateText describe(std::int64_t seconds) {
  const auto moment = static_cast<std::time_t>(seconds);
  std::tm utc{};
  DateText date;
  if (::gmtime_r(&moment, &utc) != nullptr) {
    date.length =
        std::strftime(date.text.data(), date.text.size(), "%Y-%m-%d %H:%M:%S +0000", &utc);
  }
  return date;
}

/// The local zone's offset at a moment; 0 for moments that the C library cannot convert.
std::int32_t localOffset(std::int64_t seconds) {
  const auto moment = static_cast<std::time_t>(seconds);
  std::tm local{};
  if (::localtime_r(&moment, &local) == nullptr) return 0;
  return static_cast<std::int32_t>(local.tm_gmtoff);
}

}  // namespace

OSLogDate OSLogDate::now() {
  using std::chrono::microseconds;
  const auto sinceEpoch = std::chrono::system_clock::now().time_since_epoch();
  return OSLogDate(std::chrono::floor<microseconds>(sinceEpoch).count());
}

OSLogDate OSLogDate::addingSeconds(double seconds) const {
  using Limits = std::numeric_limits<std::int64_t>;
  constexpr double kBeyond = 0x1p63;
  const double added = std::round(seconds * static_cast<double>(kMicrosecondsASecond));
  if (std::isnan(added)) return *this;
  if (added >= kBeyond) return OSLogDate(Limits::max());
  if (added < -kBeyond) return OSLogDate(Limits::min());
  const auto delta = static_cast<std::int64_t>(added);
  if (delta > 0 && microseconds > Limits::max() - delta) return OSLogDate(Limits::max());
  if (delta < 0 && microseconds < Limits::min() - delta) return OSLogDate(Limits::min());
  return OSLogDate(microseconds + delta);
}

void OSLogDate::appendDescription(std::string& text) const {
  // Of the events of a log, most come in the same second as the one before.
  static thread_local std::int64_t knownSeconds = std::numeric_limits<std::int64_t>::max();
  static thread_local DateText known;
  const std::int64_t seconds = wholeSeconds(*this);
  if (seconds != knownSeconds) {
    known = describe(seconds);
    knownSeconds = seconds;
  }
  text.append(known.text.data(), known.length);
}

std::int32_t OSLogTimeZone::secondsFromGMT(OSLogDate date) const {
  if (fixed) return *fixed;
  // Asking the C library takes its lock, and longer than all the rest of an event.
  struct Known {
    std::int64_t seconds;
    std::int32_t offset;
  };
  static thread_local Known known{std::numeric_limits<std::int64_t>::max(), 0};
  const std::int64_t seconds = wholeSeconds(date);
  if (seconds != known.seconds) known = {seconds, localOffset(seconds)};
  return known.offset;
}
