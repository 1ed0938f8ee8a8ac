#include "platform/host/device/Profile.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <filesystem>
#include <limits>
#include <utility>

#include "platform/posix/Utf8.h"

namespace host {
namespace {

using Text = std::string_view;

constexpr Text kBlanks = " \t\r";

Text trimmed(Text text) {
  const auto first = text.find_first_not_of(kBlanks);
  if (first == Text::npos) return {};
  return text.substr(first, text.find_last_not_of(kBlanks) - first + 1);
}

/// Removes the part of `text` up to `separator`, and returns it without the separator.
Text takePiece(Text& text, char separator) {
  const auto end = std::min(text.find(separator), text.size());
  const auto piece = text.substr(0, end);
  text.remove_prefix(std::min(end + 1, text.size()));
  return piece;
}

/// Reads all of `text` as an integer, decimal or with the prefix 0x hexadecimal.
template <class Number>
bool readNumber(Text text, Number& number) {
  int base = 10;
  if (text.starts_with("0x")) {
    text.remove_prefix(2);
    base = 16;
    if (text.starts_with('-')) return false;
  }
  Number read{};
  const auto* const end = text.data() + text.size();
  const auto [stopped, failed] = std::from_chars(text.data(), end, read, base);
  if (failed != std::errc() || stopped != end) return false;
  number = read;
  return true;
}

template <class Value>
bool readChoice(Text text, Value& value, std::initializer_list<std::pair<Text, Value>> choices) {
  const auto* const found = std::ranges::find(choices, text, &std::pair<Text, Value>::first);
  if (found == choices.end()) return false;
  value = found->second;
  return true;
}

// Readers of a value, by the type of the part of a profile that it sets.

bool read(Text text, int& number) { return readNumber(text, number); }

bool read(Text text, bool& flag) { return readChoice(text, flag, {{"yes", true}, {"no", false}}); }

bool read(Text text, std::string& value) {
  value = text;
  return true;
}

bool read(Text text, std::chrono::milliseconds& duration) {
  std::uint32_t count = 0;
  if (!readNumber(text, count)) return false;
  duration = std::chrono::milliseconds(count);
  return true;
}

bool read(Text text, Build& build) {
  return readChoice(
      text, build,
      {{"internal", Build::internal}, {"carrier", Build::carrier}, {"customer", Build::customer}});
}

/// A text or a fault: "!null", "!empty", or "!" and a code, as a signed number or its 32 bits in
/// hexadecimal.
bool read(Text text, Answer& answer) {
  using Kind = Answer::Kind;
  answer = {.text = std::string(text)};
  if (!text.starts_with('!')) return true;
  if (readChoice(text, answer.kind, {{"!null", Kind::nullReply}, {"!empty", Kind::emptyReply}})) {
    return true;
  }
  std::int64_t code = 0;
  answer.kind = Kind::error;
  const bool isNumber = readNumber(text.substr(1), code);
  answer.code = static_cast<std::int32_t>(code);
  return isNumber && code != 0 && code >= std::numeric_limits<std::int32_t>::min() &&
         code <= std::numeric_limits<std::uint32_t>::max();
}

bool readOkOrFault(Text text, Answer& answer) {
  return (text == "ok" || text.starts_with('!')) && read(text, answer);
}

/// A timestamp.
bool read(Text text, std::optional<std::string>& timestamp) {
  timestamp = text == "now" ? std::nullopt : std::optional<std::string>(text);
  return true;
}

/// The reason of a stream's end.
bool read(Text text, std::optional<unsigned long>& reason) {
  reason.reset();
  return text == "never" || readNumber(text, reason.emplace());
}

bool read(Text text, std::vector<ServerStep>& steps) {
  steps.clear();
  if (text == "none") return true;
  if (text.ends_with(',')) return false;
  do {
    auto state = trimmed(takePiece(text, ','));
    ServerStep step;
    const auto blank = std::min(state.find_first_of(kBlanks), state.size());
    if (!read(state.substr(0, blank), step.at)) return false;
    state.remove_prefix(blank);
    step.state = trimmed(state);
    if (step.state.empty() || (!steps.empty() && step.at < steps.back().at)) return false;
    steps.push_back(std::move(step));
  } while (!text.empty());
  return true;
}

bool readProduct(Text text, Profile& profile) {
  using enum TelephonyProduct;
  static constexpr std::pair<Text, TelephonyProduct> kNames[] = {
      {"Unknown", Unknown},         {"Phone", Phone},
      {"PhoneLarge", PhoneLarge},   {"Tablet", Tablet},
      {"TabletLarge", TabletLarge}, {"Watch1Small", Watch1Small},
      {"Watch1Large", Watch1Large}, {"Watch2Small", Watch2Small},
      {"Watch2Large", Watch2Large}, {"Watch3Small", Watch3Small},
      {"Watch3Large", Watch3Large}, {"Watch4Small", Watch4Small},
      {"Watch4Large", Watch4Large}, {"Watch5Small", Watch5Small},
      {"Watch5Large", Watch5Large}, {"Watch6Small", Watch6Small},
      {"Watch6Large", Watch6Large}, {"Watch7Small", Watch7Small},
      {"Watch7Large", Watch7Large}};
  const auto* const named =
      std::ranges::find(kNames, text, &std::pair<Text, TelephonyProduct>::first);
  if (named == std::end(kNames)) return readNumber(text, profile.product);
  profile.product = static_cast<int>(named->second);
  return true;
}

bool readProcesses(Text text, Profile& profile) {
  profile.processes.clear();
  profile.hostProcesses = false;
  while (!(text = trimmed(text)).empty()) {
    const auto name = text.substr(0, text.find_first_of(kBlanks));
    text.remove_prefix(name.size());
    if (name == "@host") {
      profile.hostProcesses = true;
    } else {
      profile.processes.emplace_back(name);
    }
  }
  return true;
}

bool readCompression(Text text, Profile& profile) {
  return readChoice(text, profile.compression, {{"nocompress", 0}, {"tar.gz", 1}, {"tar", 2}});
}

bool readDump(Text text, Profile& profile) { return readOkOrFault(text, profile.dump); }

bool readHelper(Text text, Profile& profile) {
  profile.helperExists = text != "none";
  return !profile.helperExists || readOkOrFault(text, profile.helper);
}

bool readLogPrepare(Text text, Profile& profile) {
  return read(text == "ok" ? Text() : text, profile.logPrepareError);
}

/// Reads a value that sets nothing but `Part`.
template <auto Part>
bool readPart(Text text, Profile& profile) {
  return read(text, profile.*Part);
}

struct Key {
  Text name;
  Text takes;  ///< the values, for a message
  bool (*read)(Text value, Profile& profile);
  bool mayBeEmpty = false;
};

constexpr Text kWhole = "a whole number";
constexpr Text kYesNo = "yes or no";
constexpr Text kTextOrFault = "a text, !CODE (not 0), !null or !empty";

constexpr Key kKeys[] = {
    {"radio", kWhole, readPart<&Profile::radio>},
    {"product", "a whole number or a product's name", readProduct},
    {"radio-vendor", kWhole, readPart<&Profile::radioVendor>},
    {"qdss", kYesNo, readPart<&Profile::qdss>},
    {"build", "internal, carrier or customer", readPart<&Profile::build>},
    {"compression", "nocompress, tar.gz or tar", readCompression},
    {"compression-supported", kYesNo, readPart<&Profile::compressionSupported>},
    {"processes", "names of processes", readProcesses, true},
    {"server", "none, or steps 'MS STATE' in order of time, separated by commas",
     readPart<&Profile::server>},
    {"system-logs-mode", kTextOrFault, readPart<&Profile::systemLogsMode>, true},
    {"baseband-enabled", kTextOrFault, readPart<&Profile::basebandEnabled>, true},
    {"baseband-high-throughput", kTextOrFault, readPart<&Profile::basebandHighThroughput>, true},
    {"dump", "ok, !CODE (not 0), !null or !empty", readDump},
    {"dump-timestamp", "a text", readPart<&Profile::dumpTimestamp>, true},
    {"dump-delay", "milliseconds", readPart<&Profile::dumpDelay>},
    {"helper", "ok, none, !CODE (not 0), !null or !empty", readHelper},
    {"helper-timestamp", "a text", readPart<&Profile::helperTimestamp>, true},
    {"request-log", "a path", readPart<&Profile::requestLog>},
    {"log", "sample, journal or a path", readPart<&Profile::log>},
    {"log-prepare", "ok or a text", readLogPrepare},
    {"log-end", "a whole number or never", readPart<&Profile::logEnd>},
};

std::string quoted(Text text) { return std::string("'").append(text).append("'"); }

/// The line on which each key is set, or 0.
using FirstLines = std::array<int, std::size(kKeys)>;

/// Reads one line into `profile`. Returns what is wrong, or an empty text.
std::string readLine(Text line, Profile& profile, FirstLines& firstLines, int number) {
  if (!posix::isUtf8(line)) return "not UTF-8 text";
  if (line.find('\0') != Text::npos) return "a NUL byte, which no text holds";
  line = trimmed(line.substr(0, line.find('#')));
  if (line.empty()) return {};
  const auto equals = line.find('=');
  if (equals == Text::npos) return "neither 'key = value' nor a comment: " + quoted(line);
  const auto name = trimmed(line.substr(0, equals));
  const auto value = trimmed(line.substr(equals + 1));
  const auto* const key = std::ranges::find(kKeys, name, &Key::name);
  if (key == std::end(kKeys)) return "unknown key " + quoted(name);
  int& firstLine = firstLines[static_cast<std::size_t>(key - kKeys)];
  if (firstLine > 0) {
    return quoted(name) + " is set on line " + std::to_string(firstLine) + " already";
  }
  firstLine = number;
  if ((value.empty() && !key->mayBeEmpty) || !key->read(value, profile)) {
    return quoted(name) + " takes " + std::string(key->takes) + ", not " + quoted(value);
  }
  return {};
}

}  // namespace

std::optional<std::string> parseProfile(std::string_view text, const std::string& file,
                                        Profile& profile) {
  constexpr Text kByteOrderMark = "\xEF\xBB\xBF";
  if (text.starts_with(kByteOrderMark)) text.remove_prefix(kByteOrderMark.size());
  FirstLines firstLines{};
  for (int number = 1; !text.empty(); ++number) {
    const auto wrong = readLine(takePiece(text, '\n'), profile, firstLines, number);
    if (!wrong.empty())
      return (file + ":").append(std::to_string(number)).append(": ").append(wrong);
  }
  if (profile.hasLogPath()) {
    profile.log = std::filesystem::path(file).replace_filename(profile.log);
  }
  return std::nullopt;
}

}  // namespace host
