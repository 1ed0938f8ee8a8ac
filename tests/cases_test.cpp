// The real program, from its command line and its device to what it prints, asks and returns: each
// case of tests/cases/FILE.cases is a test FILE.NAME. startup.cases describes the format.

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <map>
#include <set>
#include <sstream>
#include <stdexcept>

#include "tests/Program.h"
#include "tests/Table.h"

namespace {

const std::string kFolder = ZUBTOOL_SOURCES "/tests/cases/";

struct Case {
  std::string name;
  int line;
  Start start = {};
  Outcome expected = {};
  std::string faults = {};  ///< what is wrong with how it is written
};

/// Sets a line "KEY = VALUE" of a profile, in the place of an earlier one with that key.
void setDevice(std::string& profile, const std::string& line) {
  const auto equals = line.find('=');
  const auto key = "\n" + line.substr(0, equals) + "=";
  const auto before = equals == std::string::npos ? equals : ("\n" + profile).find(key);
  if (before == std::string::npos) {
    profile += line + '\n';
  } else {
    profile.replace(before, profile.find('\n', before) - before, line);
  }
}

class CaseFile {
 public:
  explicit CaseFile(const std::string& path) {
    std::istringstream stream(readFile(path));
    std::string line;
    while (++number, std::getline(stream, line)) {
      if (line.empty() || line.starts_with('#')) continue;
      try {
        readLine(line);
      } catch (const std::exception& fault) {
        if (cases.empty()) cases.push_back({"none", number});
        cases.back().faults += path + ':' + std::to_string(number) + ": " + fault.what() + '\n';
      }
    }
  }

  std::vector<Case> cases;

 private:
  void readLine(const std::string& line) {
    const auto blank = std::min(line.find(' '), line.size());
    const auto key = line.substr(0, blank);
    const auto text = unescaped(line.substr(std::min(blank + 1, line.size())));
    if (line.ends_with(' ')) throw std::runtime_error("a blank at the end is to be written \\s");
    if (key == "==") return startCase(text);
    if (cases.empty()) throw std::runtime_error("no case has been started");
    auto& start = cases.back().start;
    if (key == "device") return setDevice(start.profile, text);
    if (key == "not") return replace(text);
    if (key == "word" || key == "words") return addWords(start.words, text, key == "word");
    if (key == "terminal") return static_cast<void>(start.onTerminal = true);
    if (key == "no-input") return start.input.reset();
    if (key == "name") return static_cast<void>(start.name = text);
    if (key == "status") return static_cast<void>(cases.back().expected.status = std::stoi(text));
    if (key == "help") return addText("out+", unescaped(readFile(kFolder + text + ".help")));
    addText(key, text);
  }

  void startCase(const std::string& heading) {
    const auto name = heading.substr(0, heading.find(" < "));
    const auto base = heading.substr(std::min(name.size() + 3, heading.size()));
    const auto called = [this](const std::string& wanted) {
      return std::ranges::find(cases, wanted, &Case::name);
    };
    const bool isRepeated = called(name) != cases.end();
    const bool isLost = !base.empty() && called(base) == cases.end();
    cases.push_back(base.empty() || isLost ? Case() : Case(*called(base)));
    cases.back().name = name;
    cases.back().line = number;
    inherited = {"words", "in", "out", "err", "request"};
    if (isRepeated) throw std::runtime_error("another case has this name");
    if (isLost) throw std::runtime_error("no case above is called " + base);
  }

  void addWords(std::vector<std::string>& words, const std::string& text, bool isOne) {
    if (inherited.erase("words") > 0) words.clear();
    if (isOne) return words.push_back(text);
    std::istringstream stream(text);
    for (std::string word; stream >> word;) words.push_back(word);
  }

  void addText(std::string key, const std::string& text) {
    const bool endsLine = !key.ends_with('+');
    if (!endsLine) key.pop_back();
    auto& [out, err, status, requests] = cases.back().expected;
    auto& input = cases.back().start.input;
    const std::map<std::string, std::string*> texts = {
        {"in", input ? &*input : nullptr}, {"out", &out}, {"err", &err}, {"request", &requests}};
    const auto found = texts.find(key);
    if (found == texts.end() || !found->second) throw std::runtime_error("no such key: " + key);
    if (inherited.erase(key) > 0) found->second->clear();
    *found->second += text + (endsLine ? "\n" : "");
  }

  /// "OLD but NEW", in what is expected.
  void replace(const std::string& text) {
    constexpr std::string_view kBut = " but ";
    const auto middle = std::min(text.find(kBut), text.size());
    bool isFound = false;
    auto& expected = cases.back().expected;
    for (auto* const of : {&expected.out, &expected.err, &expected.requests}) {
      for (auto at = of->find(text.substr(0, middle)); at != std::string::npos;
           at = of->find(text.substr(0, middle), at + 1)) {
        of->replace(at, middle, text.substr(std::min(middle + kBut.size(), text.size())));
        isFound = true;
      }
    }
    if (!isFound) throw std::runtime_error("nothing to replace");
  }

  int number = 0;
  std::set<std::string> inherited;  ///< kinds of lines whose first one takes their place
};

class CaseTest : public testing::Test {
 public:
  CaseTest(std::string file, Case given) : path(std::move(file)), one(std::move(given)) {}

 private:
  void TestBody() override {
    const testing::ScopedTrace trace(path.c_str(), one.line, one.name);
    ASSERT_EQ(one.faults, "");
    expectOutcome(run(one.start), one.expected);
  }

  std::string path;
  Case one;
};

[[maybe_unused]] const bool kRegistered = [] {
  for (const auto& file : std::filesystem::directory_iterator(kFolder)) {
    if (file.path().extension() != ".cases") continue;
    for (const auto& one : CaseFile(file.path()).cases) {
      auto name = one.name;
      std::ranges::replace_if(
          name, [](unsigned char byte) { return !std::isalnum(byte); }, '_');
      testing::RegisterTest(
          file.path().stem().c_str(), name.c_str(), nullptr, nullptr, file.path().c_str(), one.line,
          [file, one]() -> testing::Test* { return new CaseTest(file.path(), one); });
    }
  }
  return true;
}();

}  // namespace
