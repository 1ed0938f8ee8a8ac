#pragma once

#include <gtest/gtest.h>

#include "platform/oslog_store.h"

/// Runs a stream from `date` on to its end, whose reason it returns. `each` is called with every
/// event. Checks that there is one end, after the event handler has been released.
inline unsigned long runToItsEnd(OSLogEventStream& stream, OSLogDate date,
                                 const OSLogEventStream::EventHandler& each) {
  const auto ended = dispatch::group::create();
  std::vector<unsigned long> reasons;
  auto owned = std::make_shared<int>();
  stream.setInvalidationHandler(
      [&, handler = std::weak_ptr(owned), member = dispatch::membership(ended)](auto reason, auto) {
        EXPECT_TRUE(handler.expired());
        reasons.push_back(reason);
      });
  stream.setEventHandler([&each, owned = std::move(owned)](const auto& event) { each(event); });
  stream.activateStreamFromDate(date);
  stream.setInvalidationHandler(nullptr);
  EXPECT_TRUE(ended.wait(std::chrono::seconds(60)));
  EXPECT_EQ(reasons.size(), 1U);
  return reasons.at(0);
}
