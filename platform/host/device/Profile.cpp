#include "platform/host/device/Profile.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <map>

#include "platform/posix/Utf8.h"

namespace host {
namespace {

constexpr std::string_view kBlanks = " \t\r";

std::string_view trimmed(std::string_view text) {
  const auto first = text.find_first_not_of(kBlanks);
  if (first == std::string_view::npos) return {};
  return text.substr(first, text.find_last_not_of(kBlanks) - first + 1);
}

/// Cuts the next piece up to `separator` off the front of `text`.
std::string_view takePiece(std::string_view& text, char separator) {
  const auto end = std::min(text.find(separator), text.size());
  const auto piece = text.substr(0, end);
  text.remove_prefix(std::min(end + 1, text.size()));
  return piece;
}

/// Reads all of `text` as a whole number, decimal or with 0x in front.
template <class Number>
bool readNumber(std::string_view text, Number& number) {
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
bool readChoice(std::string_view text, Value& value,
                const std::map<std::string_view, Value>& choices) {
  const auto found = choices.find(text);
  if (found == choices.end()) return false;
  value = found->second;
  return true;
}

bool readYesNo(std::string_view text, bool& flag) {
  return readChoice(text, flag, {{"yes", true}, {"no", false}});
}

bool readMilliseconds(std::string_view text, std::chrono::milliseconds& duration) {
  std::uint32_t count = 0;
  if (!readNumber(text, count)) return false;
  duration = std::chrono::milliseconds(count);
  return true;
}

/// A fault is "!null", "!empty" or "!" and a code, as a signed number or its 32 bits in
/// hexadecimal.
bool readFault(std::string_view text, Answer& answer) {
  if (!text.starts_with('!')) return false;
  text.remove_prefix(1);
  if (text == "null") {
    answer = {.kind = Answer::Kind::nullReply};
    return true;
  }
  if (text == "empty") {
    answer = {.kind = Answer::Kind::emptyReply};
    return true;
  }
  std::int64_t code = 0;
  if (!readNumber(text, code) || code == 0 || code < std::numeric_limits<std::int32_t>::min() ||
      code > std::numeric_limits<std::uint32_t>::max()) {
    return false;
  }
  answer = {.kind = Answer::Kind::error, .code = static_cast<std::int32_t>(code)};
  return true;
}

bool readOkOrFault(std::string_view text, Answer& answer) {
  if (text != "ok") return readFault(text, answer);
  answer = {};
  return true;
}

bool readTextOrFault(std::string_view text, Answer& answer) {
  if (text.starts_with('!')) return readFault(text, answer);
  answer = {.text = std::string(text)};
  return true;
}

bool readTimestamp(std::string_view text, std::optional<std::string>& timestamp) {
  timestamp = text == "now" ? std::nullopt : std::optional<std::string>(text);
  return true;
}

bool readProduct(std::string_view text, int& product) {
  using enum TelephonyProduct;
  TelephonyProduct named{};
  const bool isName = readChoice(text, named,
                                 {{"Unknown", Unknown},
                                  {"Phone", Phone},
                                  {"PhoneLarge", PhoneLarge},
                                  {"Tablet", Tablet},
                                  {"TabletLarge", TabletLarge},
                                  {"Watch1Small", Watch1Small},
                                  {"Watch1Large", Watch1Large},
                                  {"Watch2Small", Watch2Small},
                                  {"Watch2Large", Watch2Large},
                                  {"Watch3Small", Watch3Small},
                                  {"Watch3Large", Watch3Large},
                                  {"Watch4Small", Watch4Small},
                                  {"Watch4Large", Watch4Large},
                                  {"Watch5Small", Watch5Small},
                                  {"Watch5Large", Watch5Large},
                                  {"Watch6Small", Watch6Small},
                                  {"Watch6Large", Watch6Large},
                                  {"Watch7Small", Watch7Small},
                                  {"Watch7Large", Watch7Large}});
  if (isName) product = static_cast<int>(named);
  return isName || readNumber(text, product);
}

bool readProcesses(std::string_view text, Profile& profile) {
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

bool readServer(std::string_view text, std::vector<ServerStep>& steps) {
  steps.clear();
  if (text == "none") return true;
  if (text.ends_with(',')) return false;
  do {
    auto state = trimmed(takePiece(text, ','));
    ServerStep step;
    const auto blank = std::min(state.find_first_of(kBlanks), state.size());
    if (!readMilliseconds(state.substr(0, blank), step.at)) return false;
    state.remove_prefix(blank);
    step.state = trimmed(state);
    if (step.state.empty() || (!steps.empty() && step.at < steps.back().at)) return false;
    steps.push_back(std::move(step));
  } while (!text.empty());
  return true;
}

bool readLogEnd(std::string_view text, std::optional<unsigned long>& reason) {
  reason.reset();
  return text == "never" || readNumber(text, reason.emplace());
}

bool readText(std::string_view text, std::string& value) {
  value = text;
  return true;
}

/// A path in a profile is taken from the profile's own folder.
std::string besideProfile(std::string_view path, const std::string& file) {
  const auto slash = file.rfind('/');
  if (path.starts_with('/') || slash == std::string::npos) return std::string(path);
  return file.substr(0, slash + 1).append(path);
}

struct Key {
  std::string_view name;
  std::string_view takes;  ///< for the message about a bad value
  bool (*read)(std::string_view value, Profile& profile);
  bool mayBeEmpty = false;
};

constexpr std::string_view kWhole = "a whole number";
constexpr std::string_view kYesNo = "yes or no";
constexpr std::string_view kOkOrFault = "ok, !CODE (not 0), !null or !empty";
constexpr std::string_view kTextOrFault = "a text, !CODE (not 0), !null or !empty";

using Text = std::string_view;

constexpr Key kKeys[] = {
    {"radio", kWhole, [](Text t, Profile& p) { return readNumber(t, p.radio); }},
    {"product", "a whole number or a product's name",
     [](Text t, Profile& p) { return readProduct(t, p.product); }},
    {"radio-vendor", kWhole, [](Text t, Profile& p) { return readNumber(t, p.radioVendor); }},
    {"qdss", kYesNo, [](Text t, Profile& p) { return readYesNo(t, p.qdss); }},
    {"build", "internal, carrier or customer",
     [](Text t, Profile& p) {
       return readChoice(t, p.build,
                         {{"internal", Build::internal},
                          {"carrier", Build::carrier},
                          {"customer", Build::customer}});
     }},
    {"compression", "nocompress, tar.gz or tar",
     [](Text t, Profile& p) {
       return readChoice(t, p.compression, {{"nocompress", 0}, {"tar.gz", 1}, {"tar", 2}});
     }},
    {"compression-supported", kYesNo,
     [](Text t, Profile& p) { return readYesNo(t, p.compressionSupported); }},
    {"processes", "names of processes", readProcesses, true},
    {"server", "none, or steps 'MS STATE' in order of time, separated by commas",
     [](Text t, Profile& p) { return readServer(t, p.server); }},
    {"system-logs-mode", kTextOrFault,
     [](Text t, Profile& p) { return readTextOrFault(t, p.systemLogsMode); }, true},
    {"baseband-enabled", kTextOrFault,
     [](Text t, Profile& p) { return readTextOrFault(t, p.basebandEnabled); }, true},
    {"baseband-high-throughput", kTextOrFault,
     [](Text t, Profile& p) { return readTextOrFault(t, p.basebandHighThroughput); }, true},
    {"dump", kOkOrFault, [](Text t, Profile& p) { return readOkOrFault(t, p.dump); }},
    {"dump-timestamp", "a text",
     [](Text t, Profile& p) { return readTimestamp(t, p.dumpTimestamp); }, true},
    {"dump-delay", "milliseconds",
     [](Text t, Profile& p) { return readMilliseconds(t, p.dumpDelay); }},
    {"helper", "ok, none, !CODE (not 0), !null or !empty",
     [](Text t, Profile& p) {
       p.helperExists = t != "none";
       return !p.helperExists || readOkOrFault(t, p.helper);
     }},
    {"helper-timestamp", "a text",
     [](Text t, Profile& p) { return readTimestamp(t, p.helperTimestamp); }, true},
    {"request-log", "a path", [](Text t, Profile& p) { return readText(t, p.requestLog); }},
    {"log", "sample, journal or a path", [](Text t, Profile& p) { return readText(t, p.log); }},
    {"log-prepare", "ok or a text",
     [](Text t, Profile& p) { return readText(t == "ok" ? Text() : t, p.logPrepareError); }},
    {"log-end", "a whole number or never",
     [](Text t, Profile& p) { return readLogEnd(t, p.logEnd); }},
};

std::string quoted(std::string_view text) { return std::string("'").append(text).append("'"); }

/// Reads one line into `profile`. Returns what is wrong, or an empty text.
std::string readLine(std::string_view line, Profile& profile,
                     std::map<std::string_view, int>& firstLines, int number) {
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
  const auto [first, isNew] = firstLines.emplace(key->name, number);
  if (!isNew) return quoted(name) + " is set on line " + std::to_string(first->second) + " already";
  if ((value.empty() && !key->mayBeEmpty) || !key->read(value, profile)) {
    return quoted(name) + " takes " + std::string(key->takes) + ", not " + quoted(value);
  }
  return {};
}

}  // namespace

std::vector<std::string_view> profileKeys() {
  std::vector<std::string_view> names;
  for (const Key& key : kKeys) names.push_back(key.name);
  return names;
}

std::optional<std::string> parseProfile(std::string_view text, const std::string& file,
                                        Profile& profile) {
  constexpr std::string_view kByteOrderMark = "\xEF\xBB\xBF";
  if (text.starts_with(kByteOrderMark)) text.remove_prefix(kByteOrderMark.size());
  std::map<std::string_view, int> firstLines;
  for (int number = 1; !text.empty(); ++number) {
    const auto wrong = readLine(takePiece(text, '\n'), profile, firstLines, number);
    if (!wrong.empty())
      return (file + ":").append(std::to_string(number)).append(": ").append(wrong);
  }
  if (profile.hasLogPath()) profile.log = besideProfile(profile.log, file);
  return std::nullopt;
}

}  // namespace host
