#include <gtest/gtest.h>

#include "tests/Program.h"

TEST(SmallestPort, RefusesToStart) {
  expectOutcome(run({{"help"}}),
                {.out = "'zubtool' is not supported on this product.\n", .status = 255});
}
