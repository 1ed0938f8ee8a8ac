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
  std::map<std::string, std::string> device = {};  ///< lines of the profile by their keys
  Start start = {};
  Outcome expected = {};
};

/// What stands before and after the first `middle` in a text, or all of it and nothing.
std::pair<std::string, std::string> splitAt(std::string_view middle, const std::string& text) {
  const auto at = std::min(text.find(middle), text.size());
  return {text.substr(0, at), text.substr(std::min(at + middle.size(), text.size()))};
}

/// Throws what is wrong with how a file is written: then no test of the program is listed.
class CaseFile {
 public:
  explicit CaseFile(const std::string& path) {
    std::istringstream stream(readFile(path));
    std::string line;
    while (++number, std::getline(stream, line)) {
      try {
        if (!line.empty() && !line.starts_with('#')) readLine(line);
      } catch (const std::exception& fault) {
        throw std::runtime_error(path + ':' + std::to_string(number) + ": " + fault.what());
      }
    }
  }

  std::vector<Case> cases;

 private:
  void readLine(const std::string& line) {
    const auto& [key, escaped] = splitAt(" ", line);
    const auto text = unescaped(escaped);
    if (key == "==") return startCase(text);
    if (cases.empty()) throw std::runtime_error("no case has been started");
    auto& [name, first, device, start, expected] = cases.back();
    if (key == "device") return static_cast<void>(device[splitAt(" =", text).first] = text);
    if (key == "not") return replace(text);
    if (key == "words") return setWords(start.words, escaped);
    if (key == "name") return static_cast<void>(start.name = text);
    if (key == "status") return static_cast<void>(expected.status = std::stoi(text));
    if (key == "help") return addText("out+", unescaped(readFile(kFolder + text + ".help")));
    addText(key, text);
  }

  void startCase(const std::string& heading) {
    const auto& [name, base] = splitAt(" < ", heading);
    const auto above = std::ranges::find(cases, base, &Case::name);
    if (above == cases.end() && !base.empty()) throw std::runtime_error("no such case above");
    cases.push_back(base.empty() ? Case() : Case(*above));
    cases.back().name = name;
    cases.back().line = number;
    inherited = {"in", "out", "err", "request"};
  }

  static void setWords(std::vector<std::string>& words, const std::string& escaped) {
    words.clear();
    std::istringstream stream(escaped);
    for (std::string word; stream >> word;) words.push_back(word == "''" ? "" : unescaped(word));
  }

  void addText(std::string key, const std::string& text) {
    const bool endsLine = !key.ends_with('+');
    if (!endsLine) key.pop_back();
    auto& [out, err, status, requests] = cases.back().expected;
    const std::map<std::string, std::string*> texts = {
        {"in", &cases.back().start.input}, {"out", &out}, {"err", &err}, {"request", &requests}};
    const auto found = texts.find(key);
    if (found == texts.end()) throw std::runtime_error("no such key: " + key);
    if (inherited.erase(key) > 0) found->second->clear();
    *found->second += text + (endsLine ? "\n" : "");
  }

  /// "OLD but NEW", in what is expected.
  void replace(const std::string& text) {
    const auto& [old, replacement] = splitAt(" but ", text);
    bool isFound = false;
    auto& expected = cases.back().expected;
    for (auto* const of : {&expected.out, &expected.err, &expected.requests}) {
      for (auto at = of->find(old); at != std::string::npos; at = of->find(old, at + 1)) {
        of->replace(at, old.size(), replacement);
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
    for (const auto& [key, line] : one.device) one.start.profile += line + '\n';
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
      const auto isMark = [](unsigned char byte) { return !std::isalnum(byte); };
      std::ranges::replace_if(name, isMark, '_');
      testing::RegisterTest(
          file.path().stem().c_str(), name.c_str(), nullptr, nullptr, file.path().c_str(), one.line,
          [file, one]() -> testing::Test* { return new CaseTest(file.path(), one); });
    }
  }
  return true;
}();

}  // namespace
