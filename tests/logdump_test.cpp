#include <gtest/gtest.h>

#include <thread>

#include "logdump/LogdumpOptions.h"
#include "logdump/TraceNames.h"
#include "logdump/TraceProperty.h"
#include "platform/host/Device.h"
#include "tests/Table.h"
#include "tool/ServerState.h"
#include "tool/ZUBCommand.h"

namespace {

TEST(TraceProperty, ReadsWordsAndNumbers) {
  for (const auto& row : readTable("trace-property", 3)) {
    const auto mode = parseTraceMode(row[0]);
    EXPECT_EQ(mode ? std::to_string(*mode) : "-", row[1]) << '"' << row[0] << '"';
    for (const bool before : {false, true}) {
      bool after = before;
      parseBoolProperty(row[0], after);
      EXPECT_EQ(after, row[2] == "-" ? before : row[2] == "true") << '"' << row[0] << '"';
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
