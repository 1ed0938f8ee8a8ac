#include <gtest/gtest.h>

#include "tests/Program.h"

TEST(SmallestPort, RefusesToStart) {
  EXPECT_EQ(run({{"help"}}),
            (Outcome{.out = "'zubtool' is not supported on this product.\n", .status = 255}));
}
