// Any bytes as a device profile: it is read, or refused with its file and line.

#include <cstdint>
#include <cstdlib>

#include "platform/host/device/Profile.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  host::Profile profile;
  const auto wrong = host::parseProfile(text, "p.device", profile);
  if (wrong && !wrong->starts_with("p.device:")) std::abort();
  return 0;
}
