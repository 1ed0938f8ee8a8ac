#include "tool/StartUpChecks.h"

#include "platform/telephony.h"

namespace {

bool DaemonsAreRunning() {
  // Both are asked, whatever the first answer.
  const bool telephony = tlu::isProcessRunning("Orvalind");
  const bool watch = config::hw::watch();
  return telephony || watch || tlu::isProcessRunning("modemd");
}

}  // namespace

const char* WhyNotToStart() {
  if (TelephonyRadiosGetRadio() == 0) return "'zubtool' is not supported on this product.";
  if (!DaemonsAreRunning()) {
    return "Orvalind process is not running. Please run/load Orvalind (or modemd) and try again.";
  }
  return nullptr;
}

bool config::hw::watch() {
  const auto product = static_cast<TelephonyProduct>(TelephonyRadiosGetProduct());
  return product >= TelephonyProduct::Watch1Small && product <= TelephonyProduct::Watch7Large;
}
