// The start-up checks over a telephony library that notes what it is asked.

#include <gtest/gtest.h>

#include "platform/telephony.h"
#include "tool/StartUpChecks.h"

namespace {

struct {
  int radio = 1;
  int product = 0;
  std::string running;
  std::string asked;
} device;

TEST(StartUpChecks, AskInTheirOrderAndNotMoreThanTheyMust) {
  const auto watch = static_cast<int>(TelephonyProduct::Watch1Small);
  const struct {
    int radio, product;
    std::string running, asked;
    bool starts;
  } cases[] = {{0, watch, "Orvalind", "radio ", false},
               {1, 0, "Orvalind", "radio Orvalind product ", true},
               {1, watch, "", "radio Orvalind product ", true},
               {1, 0, "modemd", "radio Orvalind product modemd ", true},
               {1, 0, "", "radio Orvalind product modemd ", false}};
  for (const auto& one : cases) {
    device = {one.radio, one.product, one.running, ""};
    EXPECT_EQ(WhyNotToStart() == nullptr, one.starts) << one.asked;
    EXPECT_EQ(device.asked, one.asked);
  }
  for (int product = 0; product < 60; ++product) {
    device = {1, product, "", ""};
    EXPECT_EQ(WhyNotToStart() == nullptr, product >= 32 && product < 46) << product;
  }
}

}  // namespace

int TelephonyRadiosGetRadio() { return device.asked += "radio ", device.radio; }
int TelephonyRadiosGetProduct() { return device.asked += "product ", device.product; }
bool tlu::isProcessRunning(const std::string& name) {
  return device.asked += name + " ", name == device.running;
}
