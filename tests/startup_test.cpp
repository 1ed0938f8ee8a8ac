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

int answer(const std::string& question, int with) {
  device.asked += question + ' ';
  return with;
}

TEST(StartUpChecks, AskInTheirOrderAndNotMoreThanTheyMust) {
  for (int product = 0; product < 60; ++product) {
    for (const std::string running : {"", "Orvalind", "modemd"}) {
      device = {1, product, running, ""};
      const bool isWatch = product >= 32 && product < 46;
      const bool isEnough = isWatch || running == "Orvalind";
      EXPECT_EQ(WhyNotToStart() == nullptr, isEnough || running == "modemd") << product << running;
      EXPECT_EQ(device.asked, std::string("radio Orvalind product ") + (isEnough ? "" : "modemd "));
    }
  }
  device = {0, 32, "Orvalind", ""};
  EXPECT_TRUE(WhyNotToStart());
  EXPECT_EQ(device.asked, "radio ");
}

}  // namespace

int TelephonyRadiosGetRadio() { return answer("radio", device.radio); }
int TelephonyRadiosGetProduct() { return answer("product", device.product); }
bool tlu::isProcessRunning(const std::string& name) {
  return answer(name, name == device.running ? 1 : 0) == 1;
}
