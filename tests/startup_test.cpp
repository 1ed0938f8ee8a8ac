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
  for (const auto& [radio, running, asked] : {std::tuple(0, "Orvalind", "radio "),
                                              {1, "Orvalind", "radio Orvalind product "},
                                              {1, "modemd", "radio Orvalind product modemd "}}) {
    device = {radio, 0, running, ""};
    EXPECT_EQ(WhyNotToStart() == nullptr, radio == 1) << asked;
    EXPECT_EQ(device.asked, asked);
  }
  for (int product = 0; product < 60; ++product) {
    device = {1, product, "", ""};
    const bool isWatch = product >= 32 && product < 46;
    EXPECT_EQ(WhyNotToStart() == nullptr, isWatch) << product;
    EXPECT_EQ(device.asked, isWatch ? "radio Orvalind product " : "radio Orvalind product modemd ");
  }
}

}  // namespace

int TelephonyRadiosGetRadio() { return answer("radio", device.radio); }
int TelephonyRadiosGetProduct() { return answer("product", device.product); }
bool tlu::isProcessRunning(const std::string& name) {
  return answer(name, name == device.running ? 1 : 0) == 1;
}
