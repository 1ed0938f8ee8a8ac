#include "tool/Watch.h"

#include "platform/telephony.h"

bool config::hw::watch() {
  using enum TelephonyProduct;
  switch (static_cast<TelephonyProduct>(TelephonyRadiosGetProduct())) {
    case Watch1Small:
    case Watch1Large:
    case Watch2Small:
    case Watch2Large:
    case Watch3Small:
    case Watch3Large:
    case Watch4Small:
    case Watch4Large:
    case Watch5Small:
    case Watch5Large:
    case Watch6Small:
    case Watch6Large:
    case Watch7Small:
    case Watch7Large:
      return true;
    default:
      return false;
  }
}
