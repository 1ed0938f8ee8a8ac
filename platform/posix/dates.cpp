#include <array>
#include <chrono>
#include <cmath>
#include <cstdlib>
#include <ctime>
#include <limits>
#include <string_view>

#include "platform/oslog_store.h"

namespace {

constexpr std::int64_t kMicrosecondsASecond = 1'000'000;
constexpr std::int64_t kSecondsADay = 86'400;

constexpr std::int64_t floorDivide(std::int64_t value, std::int64_t divisor) {
  return value / divisor - (value % divisor < 0 ? 1 : 0);
}

std::int64_t wholeSeconds(OSLogDate date) {
  return floorDivide(date.microsecondsSince1970(), kMicrosecondsASecond);
}

struct Day {
  std::int64_t year;
  unsigned month;
  unsigned day;
};

/// The day of the Gregorian calendar, carried back before it was in use. `std::chrono` knows years
/// of 16 bits alone, and a date holds more.
constexpr Day civilDay(std::int64_t daysSince1970) {
  constexpr std::int64_t kDaysOf400Years = 146'097;
  constexpr std::int64_t kDaysFromMarchOfYear0 = 719'468;
  // Years begin in March here, so that the leap day is a year's last.
  const std::int64_t days = daysSince1970 + kDaysFromMarchOfYear0;
  const std::int64_t era = floorDivide(days, kDaysOf400Years);
  const auto dayOfEra = static_cast<unsigned>(days - era * kDaysOf400Years);
  const unsigned yearOfEra =
      (dayOfEra - dayOfEra / 1'460 + dayOfEra / 36'524 - dayOfEra / 146'096) / 365;
  const unsigned dayOfYear = dayOfEra - (365 * yearOfEra + yearOfEra / 4 - yearOfEra / 100);
  const unsigned month = (5 * dayOfYear + 2) / 153;
  const std::int64_t year = era * 400 + yearOfEra + (month >= 10 ? 1 : 0);
  return {year, month < 10 ? month + 3 : month - 9, dayOfYear - (153 * month + 2) / 5 + 1};
}

/// Writes `number` in at least `digits` digits before `end`, and returns where it starts.
char* writeBefore(char* end, std::uint64_t number, int digits) {
  for (; digits > 0 || number != 0; --digits, number /= 10) {
    *--end = static_cast<char>('0' + number % 10);
  }
  return end;
}

/// The text of a date, at the end of the room for the longest year that a date can have.
struct DateText {
  std::array<char, sizeof "-000000-MM-DD HH:MM:SS +0000" - 1> text{};
  std::size_t start = 0;
};

DateText describe(std::int64_t secondsSince1970) {
  constexpr std::string_view kZone = " +0000";
  const std::int64_t days = floorDivide(secondsSince1970, kSecondsADay);
  const auto ofDay = static_cast<std::uint64_t>(secondsSince1970 - days * kSecondsADay);
  const Day day = civilDay(days);
  DateText date;
  char* start = date.text.data() + date.text.size() - kZone.size();
  kZone.copy(start, kZone.size());
  start = writeBefore(start, ofDay % 60, 2);
  *--start = ':';
  start = writeBefore(start, ofDay / 60 % 60, 2);
  *--start = ':';
  start = writeBefore(start, ofDay / 3'600, 2);
  *--start = ' ';
  start = writeBefore(start, day.day, 2);
  *--start = '-';
  start = writeBefore(start, day.month, 2);
  *--start = '-';
  start = writeBefore(start, static_cast<std::uint64_t>(std::abs(day.year)), 4);
  if (day.year < 0) *--start = '-';
  date.start = static_cast<std::size_t>(start - date.text.data());
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
  thread_local std::int64_t knownSeconds = std::numeric_limits<std::int64_t>::max();
  thread_local DateText known;
  const std::int64_t seconds = wholeSeconds(*this);
  if (seconds != knownSeconds) {
    known = describe(seconds);
    knownSeconds = seconds;
  }
  text.append(known.text.data() + known.start, known.text.size() - known.start);
}

std::int32_t OSLogTimeZone::secondsFromGMT(OSLogDate date) const {
  if (fixed) return *fixed;
  // Asking the C library takes its lock and longer than all the rest of an event. Since 1970 no
  // zone has changed its offset at anything finer than half a minute.
  constexpr std::int64_t kSpan = 30;
  struct Known {
    std::int64_t span;
    std::int32_t offset;
  };
  thread_local Known known{std::numeric_limits<std::int64_t>::max(), 0};
  const std::int64_t seconds = wholeSeconds(date);
  const std::int64_t span = floorDivide(seconds, kSpan);
  if (span != known.span) known = {span, localOffset(seconds)};
  return known.offset;
}
