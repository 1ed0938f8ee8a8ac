#include <chrono>
#include <cmath>
#include <ctime>
#include <limits>

#include "platform/oslog_store.h"

namespace {

/// The seconds of no date.
constexpr std::time_t kNever = std::numeric_limits<std::time_t>::max();

std::time_t wholeSeconds(OSLogDate date) {
  const std::chrono::microseconds since(date.microsecondsSince1970());
  return static_cast<std::time_t>(std::chrono::floor<std::chrono::seconds>(since).count());
}

}  // namespace

OSLogDate OSLogDate::now() {
  const auto sinceEpoch = std::chrono::system_clock::now().time_since_epoch();
  return OSLogDate(std::chrono::floor<std::chrono::microseconds>(sinceEpoch).count());
}

OSLogDate OSLogDate::addingSeconds(double seconds) const {
  using Limits = std::numeric_limits<std::int64_t>;
  constexpr double kBeyond = 0x1p63;
  const double added = std::round(seconds * 1e6);
  if (std::isnan(added)) return *this;
  if (added >= kBeyond) return OSLogDate(Limits::max());
  if (added < -kBeyond) return OSLogDate(Limits::min());
  const auto delta = static_cast<std::int64_t>(added);
  if (delta > 0 && microseconds > Limits::max() - delta) return OSLogDate(Limits::max());
  if (delta < 0 && microseconds < Limits::min() - delta) return OSLogDate(Limits::min());
  return OSLogDate(microseconds + delta);
}

void OSLogDate::appendDescription(std::string& text) const {
  // Most events of a log have the same second as the event before.
  static thread_local std::time_t knownSeconds = kNever;
  static thread_local char known[sizeof "-290308-MM-DD HH:MM:SS +0000"];
  const std::time_t seconds = wholeSeconds(*this);
  if (seconds != knownSeconds) {
    std::tm utc{};
    ::gmtime_r(&seconds, &utc);
    std::strftime(known, sizeof known, "%Y-%m-%d %H:%M:%S +0000", &utc);
    knownSeconds = seconds;
  }
  text.append(known);
}

std::int32_t OSLogTimeZone::secondsFromGMT(OSLogDate date) const {
  if (fixed) return *fixed;
  // The C library takes a lock, and longer than all the rest of an event.
  static thread_local std::time_t knownSeconds = kNever;
  static thread_local std::int32_t known;
  const std::time_t seconds = wholeSeconds(date);
  if (seconds != knownSeconds) {
    std::tm local{};
    ::localtime_r(&seconds, &local);
    known = static_cast<std::int32_t>(local.tm_gmtoff);
    knownSeconds = seconds;
  }
  return known;
}
