#pragma once

#include <cstdint>
#include <string>
#include <string_view>

/// The telephony utility library, which describes the device.
///
/// Threads: any. No function fails: for what the device does not know, each returns 0 or false.

/// The products that the tool knows by name. The codes are those of the device's services; those of
/// the watches follow one another.
enum class TelephonyProduct : int {
  Unknown = 0,
  Phone = 1,
  PhoneLarge = 2,
  Tablet = 16,
  TabletLarge = 17,
  Watch1Small = 32,
  Watch1Large = 33,
  Watch2Small = 34,
  Watch2Large = 35,
  Watch3Small = 36,
  Watch3Large = 37,
  Watch4Small = 38,
  Watch4Large = 39,
  Watch5Small = 40,
  Watch5Large = 41,
  Watch6Small = 42,
  Watch6Large = 43,
  Watch7Small = 44,
  Watch7Large = 45,
};

/// The radio vendor of the KOV family; every other vendor code is of the ZAT family.
inline constexpr int kTelephonyRadioVendorKOV = 2;

/// The code of the product's cellular radio; 0 when it has none.
int TelephonyRadiosGetRadio();

/// The code of the product, which `TelephonyProduct` need not have.
int TelephonyRadiosGetProduct();

/// The code of the radio's vendor.
int TelephonyRadiosGetRadioVendor();

/// Whether the radio's diagnostic interface can trace over QDSS, the high-throughput path.
bool TelephonyCapabilitiesRadioDIAGSupportsQDSS();

bool TelephonyUtilIsInternalBuild();
bool TelephonyUtilIsCarrierBuild();

namespace tlu {

/// A destination for the log of a service. Opaque.
class LogServer;

/// True when a process with exactly this name is running.
bool isProcessRunning(const std::string& name);

}  // namespace tlu

namespace defaults::compression {

/// How collected logs are packaged by default: 0 not at all, 1 tar.gz, 2 tar.
std::int32_t mode();

/// Whether this device can compress logs at all.
bool supported();

}  // namespace defaults::compression

namespace util {

/// True when the texts are equal, ignoring the case of ASCII letters.
bool equal_nocase(std::string_view left, std::string_view right);

}  // namespace util
