#pragma once

/// Returns the reason why the tool cannot run on this device, or null if it can. The product must
/// have a cellular radio and, unless it is a watch, a running telephony or baseband daemon.
const char* WhyNotToStart();

namespace config::hw {

/// Whether this product is a watch.
bool watch();

}  // namespace config::hw
