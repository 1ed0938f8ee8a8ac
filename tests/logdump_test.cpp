#include <gtest/gtest.h>

#include <thread>

#include "logdump/LogdumpOptions.h"
#include "logdump/TraceNames.h"
#include "logdump/TraceProperty.h"
#include "platform/host/Device.h"
#include "tool/ServerState.h"
#include "tool/ZUBCommand.h"

namespace {

TEST(TraceProperty, ReadsWordsAndNumbers) {
  using Mode = std::optional<std::int32_t>;
  using Flag = std::optional<bool>;  // none: left as it was
  const struct {
    std::string value;
    Mode mode;
    Flag flag;
  } cases[] = {
      {"FALSE", 0, false},
      {"oFf", 0, false},
      {"no", 0, false},
      {"True", 1, true},
      {"oN", 1, true},
      {"YES", 1, true},
      {"Full", 1, true},
      {"LITE", 2, true},
      {"lite ", {}, {}},
      {" on", {}, {}},
      {"", {}, {}},
      {" ", {}, {}},
      {"0", 0, false},
      {"-0", 0, false},
      {"1", 1, true},
      {" \t\n+1", 1, true},
      {"0x1", 1, true},
      {"01", 1, true},
      {"1 ", {}, {}},
      {"1.0", {}, {}},
      {std::string("1\0", 2), {}, {}},
      {"-1", -1, {}},
      {"2", 2, {}},
      {"0x2", 2, {}},
      {"010", 8, {}},
      {"08", {}, {}},
      {"0x", {}, {}},
      {"2abc", {}, {}},
      {"2147483647", 2147483647, {}},
      {"-2147483648", std::numeric_limits<std::int32_t>::min(), {}},
      {"2147483648", {}, {}},
      {"-2147483649", {}, {}},
      {"4294967297", {}, {}},
      {"18446744073709551617", {}, {}},
      {"-9223372036854775809", {}, {}},
  };
  for (const auto& [value, mode, flag] : cases) {
    EXPECT_EQ(parseTraceMode(value), mode) << '"' << value << '"';
    for (const bool before : {false, true}) {
      bool after = before;
      parseBoolProperty(value, after);
      EXPECT_EQ(after, flag.value_or(before)) << '"' << value << '"';
    }
  }
}

TEST(LogdumpOptions, TakeWordsInAnyOrderUpToTheReason) {
  using enum CompressionMode;
  const struct {
    std::list<std::string> words;  // reversed, as every word list
    CompressionMode mode;
    std::string reason;
    bool noUi;
  } cases[] = {
      {{}, tar, "[zubtool] User triggered", false},
      {{"crash", "NonUI", "TAR.GZ"}, tarGz, "[zubtool] crash", true},
      {{"nocompress", "tar"}, none, "[zubtool] User triggered", false},
      {{"tar.gz", "nocompress", "nonui", "nonui"}, tarGz, "[zubtool] User triggered", true},
      {{"nonui", "nocompress", "tar.gz2"}, tar, "[zubtool] tar.gz2", false},
      {{""}, tar, "[zubtool] ", false},
  };
  for (const auto& [words, mode, reason, noUi] : cases) {
    auto parsedMode = tar;
    std::string parsedReason = "before";
    bool parsedNoUi = false;
    parseLogdumpOptions(words, parsedMode, parsedReason, parsedNoUi);
    EXPECT_EQ(parsedMode, mode) << reason;
    EXPECT_EQ(parsedReason, reason);
    EXPECT_EQ(parsedNoUi, noUi) << reason;
  }
}

TEST(TraceNames, FollowTheVendorAndTheCoreDumpSuffixOnlyOnce) {
  auto& vendor = host::device().radioVendor;
  const auto before = vendor;
  vendor = kTelephonyRadioVendorKOV;
  std::vector<std::string> suffixes(4);
  {
    std::vector<std::jthread> callers;
    for (auto& suffix : suffixes) {
      callers.emplace_back([&suffix] { suffix = zub::trace::getCoreDumpDirSuffix(); });
    }
  }
  EXPECT_EQ(suffixes, std::vector<std::string>(4, "-coredump"));
  EXPECT_EQ(zub::trace::getBasebandTraceDirSuffix(true), "-bb-trace");
  vendor = 0;
  EXPECT_EQ(zub::trace::getCoreDumpDirSuffix(), "-coredump");
  EXPECT_EQ(zub::trace::getBasebandTraceDirSuffix(true), "-qdss");
  EXPECT_EQ(zub::trace::getBasebandTraceDirSuffix(false), "-diag");
  vendor = before;
}

TEST(ServerState, RunsOnlyInTheStartedState) {
  const auto stateIs = [](lumo::object state) {
    lumo::dict payload;
    payload.set("Other", "Started");
    payload.set(zub::kKeyServerState, std::move(state));
    return payload;
  };
  const lumo::object others[] = {{},
                                 lumo::dict(),
                                 "Started",
                                 stateIs(true),
                                 stateIs("started"),
                                 stateIs("Started "),
                                 stateIs(""),
                                 stateIs({}),
                                 stateIs(stateIs("Started"))};
  EXPECT_FALSE(IsServerRunning());
  for (const auto& other : others) {
    NoteServerState(stateIs("Started"));
    EXPECT_TRUE(IsServerRunning());
    NoteServerState(other);
    EXPECT_FALSE(IsServerRunning());
  }
}

TEST(ZUBCommand, SharesItsConnectionAndGivesItBack) {
  const auto queueThread = dispatch::group::create();
  std::weak_ptr<zub::client::Manager> manager;
  {
    const dispatch::queue queue("tree");
    queue.async([queueThread] {
      const thread_local dispatch::membership untilTheThreadEnds(queueThread);
      static_cast<void>(untilTheThreadEnds);
    });
    const auto own = zub::client::CreateManager("test", queue);
    manager = own;
    const auto root = ZUBCommand::create("zubtool", {}, own, queue);
    const auto logdump = root->getSubCommandObj("logdump");
    EXPECT_EQ(logdump->getParent().lock(), root);
    const auto* const node = dynamic_cast<ZUBCommandBase*>(logdump.get());
    ASSERT_NE(node, nullptr);
    EXPECT_EQ(node->manager, own);
    EXPECT_EQ(node->queue, queue);
    EXPECT_EQ(manager.use_count(), 3);
  }
  EXPECT_TRUE(manager.expired());
  EXPECT_TRUE(queueThread.wait(std::chrono::seconds(60)));
}

}  // namespace
