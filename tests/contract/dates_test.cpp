#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <limits>
#include <thread>

#include "platform/oslog_store.h"
#include "tests/Table.h"

namespace {

TEST(Dates, HaveTheirDefaultForm) {
  using Limits = std::numeric_limits<std::int64_t>;
  forEachRow("dates", 2, [](const Row& row) {
    std::string text;
    OSLogDate(std::stoll(row[0])).appendDescription(text);
    EXPECT_EQ(text, row[1]);
  });
  const OSLogDate date(5);
  EXPECT_EQ(date.addingSeconds(-0.29), OSLogDate(5 - 290'000));
  EXPECT_EQ(date.addingSeconds(std::nan("")), date);
  EXPECT_EQ(date.addingSeconds(INFINITY), OSLogDate(Limits::max()));
  EXPECT_EQ(date.addingSeconds(0x1p63 / 1e6), OSLogDate(Limits::max()));
  EXPECT_EQ(OSLogDate(Limits::min()).addingSeconds(-1), OSLogDate(Limits::min()));
}

TEST(Dates, AreInALocalZoneWithItsSummerTime) {
  setenv("TZ", "CET-1CEST,M3.5.0/2:30:20,M10.5.0/3", 1);
  tzset();
  std::thread([] {  // one that has not asked before
    const OSLogTimeZone local;
    EXPECT_EQ(local.secondsFromGMT(OSLogDate(1'711'848'619'999'999)), 3'600);
    EXPECT_EQ(local.secondsFromGMT(OSLogDate(1'711'848'620'000'000)), 7'200);
  })
      .join();
  unsetenv("TZ");
  tzset();
}

}  // namespace
