// The real program, from its command line and its device to what it prints, asks and returns.

#include <gtest/gtest.h>
#include <sys/resource.h>

#include <algorithm>
#include <filesystem>
#include <map>
#include <set>
#include <sstream>

#include "tests/Program.h"
#include "tests/Table.h"

namespace {

struct Case {
  std::string what;
  Start start;
  Outcome expected;
};

/// Takes one line of a case; false for one that means nothing.
bool readLine(Case& one, std::string key, const std::string& text) {
  auto& start = one.start;
  const std::map<std::string, std::string*> texts = {{"device", &start.profile},
                                                     {"in", start.input ? &*start.input : nullptr},
                                                     {"out", &one.expected.out},
                                                     {"err", &one.expected.err},
                                                     {"request", &one.expected.requests}};
  const std::map<std::string, bool*> switches = {{"terminal", &start.onTerminal},
                                                 {"no-reader", &start.readerGone}};
  if (const auto on = switches.find(key); on != switches.end()) return *on->second = true;
  if (key == "no-input") return start.input.reset(), true;
  if (key == "word") return start.words.push_back(text), true;
  if (key == "name") return start.name = text, true;
  if (key == "status") return one.expected.status = std::stoi(text), true;
  if (key == "words") {
    std::istringstream words(text);
    for (std::string word; words >> word;) start.words.push_back(word);
    return true;
  }
  const bool endsLine = !key.ends_with('+');
  if (!endsLine) key.pop_back();
  const auto target = texts.find(key);
  if (target == texts.end() || !target->second) return false;
  *target->second += unescaped(text) + (endsLine ? "\n" : "");
  return true;
}

/// The cases of a file; tests/cases/startup.cases tells the format.
std::vector<Case> readCases(const std::string& file) {
  std::vector<Case> cases;
  std::istringstream stream(readFile(file));
  for (std::string line; std::getline(stream, line);) {
    if (line.empty() || line.starts_with('#')) continue;
    const auto blank = line.find(' ');
    const auto key = line.substr(0, blank);
    const auto text = blank == std::string::npos ? "" : line.substr(blank + 1);
    const bool isCase = key == "==";
    if (isCase) cases.emplace_back().what = text;
    EXPECT_TRUE(isCase || (!cases.empty() && readLine(cases.back(), key, text))) << file << line;
  }
  return cases;
}

class ProgramCases : public ::testing::TestWithParam<std::string> {};

TEST_P(ProgramCases, LeaveBehindWhatTheyShould) {
  const auto cases =
      readCases(std::string(ZUBTOOL_SOURCES "/tests/cases/") + GetParam() + ".cases");
  EXPECT_FALSE(cases.empty());
  // All at once: each waits half a second for the server's first word.
  std::vector<Program> programs;
  for (const auto& one : cases) programs.emplace_back(one.start);
  for (std::size_t i = 0; i < cases.size(); ++i) {
    EXPECT_EQ(programs[i].finish(), cases[i].expected) << cases[i].what;
  }
}

std::vector<std::string> caseFiles() {
  std::vector<std::string> names;
  for (const auto& file : std::filesystem::directory_iterator(ZUBTOOL_SOURCES "/tests/cases")) {
    names.push_back(file.path().stem());
  }
  return names;
}

INSTANTIATE_TEST_SUITE_P(Files, ProgramCases, ::testing::ValuesIn(caseFiles()),
                         [](const auto& file) { return file.param; });

TEST(Program, FollowsTheServerWhileItPrompts) {
  const std::string prompt = "(/zubtool)>> ";
  const std::string success =
      "Telephony log collection with Coredump: Success\nPath = "
      "/private/var/wireless/Library/Logs/CrashVault/Baseband/log-bb-T.tar.gz\n";
  Program program({.profile = "server = 2000 Started\ndump-timestamp = T"});
  EXPECT_EQ(program.readUntil(prompt), prompt);
  int refused = 0;
  for (bool isRefused = true; isRefused; refused += isRefused ? 1 : 0) {
    program.type("logdump core\n");
    const auto answer = program.readUntil(prompt);
    isRefused = answer == prompt;
    EXPECT_TRUE(isRefused || answer == success + prompt) << answer;
  }
  std::set<std::string> threads;
  for (const auto& task :
       std::filesystem::directory_iterator("/proc/" + std::to_string(program.pid()) + "/task")) {
    threads.insert(readFile(task.path() / "comm"));
  }
  EXPECT_TRUE(threads.contains("zubtool.queue\n"));
  const auto outcome = program.finish();
  EXPECT_GT(refused, 0);
  EXPECT_EQ(std::ranges::count(outcome.err, '\n'), refused);
  EXPECT_EQ(std::ranges::count(outcome.requests, '\n'), 1);
}

TEST(Program, LosesNothingToASlowReader) {
  constexpr int kLines = 2000;  // of help, far more than a pipe holds
  const std::string prompt = "(/zubtool)>> ";
  Program program({});
  EXPECT_EQ(program.readUntil(prompt), prompt);
  std::string lines;
  for (int i = 0; i < kLines; ++i) lines += "help\n";
  program.type(lines + "quit\n");
  const auto outcome = program.finish();  // which reads a byte at a time
  EXPECT_EQ(outcome.status, 0);
  EXPECT_EQ(outcome.out.size(), kLines * (run({{"help"}}).out.size() + prompt.size()));
}

TEST(Program, ExportsTheLogOfARealMachine) {
  const ScratchFolder folder;
  const std::string data = ZUBTOOL_SOURCES "/tests/data/machine.";
  const Start start = {{"logdump", "oslog", "2147483647", folder.path("out"), "-p",
                        "systemd-journald", "-i", "LOGGER", "python"},
                       "log = " + data + "export"};
  EXPECT_EQ(run(start), Outcome());
  EXPECT_EQ(readFile(folder.path("out")), readFile(data + "txt"));
  EXPECT_EQ(run({{"logdump", "oslog", "600", folder.path("out")}}), Outcome());
  const auto sample = readFile(folder.path("out"));
  EXPECT_EQ(std::ranges::count(sample, '\n'), 6) << sample;
  const auto own = run({{"logdump", "oslog", "600", data + "export"}, "log = " + data + "export"});
  EXPECT_EQ(own, Outcome{.status = 1}) << "the log itself is no place to export to";
}

TEST(Program, EndsWhenTheShellThreadCannotStart) {
  rlimit before{};
  ASSERT_EQ(getrlimit(RLIMIT_STACK, &before), 0);
  const rlim_t size = sizeof(void*) == 8 ? rlim_t{1} << 46 : 0xF0000000;  // of a thread's stack
  const rlimit huge = {size, before.rlim_max};
  if (setrlimit(RLIMIT_STACK, &huge) != 0) GTEST_SKIP() << "the stack's limit is fixed";
  const auto outcome = run({{"help"}});
  setrlimit(RLIMIT_STACK, &before);
  if (outcome.err.starts_with("FATAL: ThreadSanitizer")) GTEST_SKIP() << "it needs its own layout";
  EXPECT_EQ(outcome, (Outcome{.err = "Cannot start the shell thread: Resource temporarily "
                                     "unavailable\n",
                              .status = 255}));
}

TEST(Program, ExitsWhileTheQueueStillWorks) {
  std::string steps = "server = 0 Started";
  for (int i = 0; i < 4000; ++i) steps += ", " + std::to_string(400 + i / 20) + " Started";
  std::vector<Program> programs;
  for (int i = 0; i < 8; ++i) programs.emplace_back(Start{{"--"}, steps});
  for (auto& program : programs) EXPECT_EQ(program.finish(), Outcome());
}

}  // namespace
