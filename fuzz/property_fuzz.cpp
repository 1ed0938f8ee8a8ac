// Any text of a trace property: the two readings agree where they have the same words and numbers.

#include <cstdint>
#include <cstdlib>

#include "logdump/TraceProperty.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string value(reinterpret_cast<const char*>(data), size);
  bool fromOff = false;
  bool fromOn = true;
  parseBoolProperty(value, fromOff);
  parseBoolProperty(value, fromOn);
  const auto mode = ParseTraceMode(value);
  if (mode == 0 && (fromOff || fromOn)) std::abort();
  if (mode == 1 && !(fromOff && fromOn)) std::abort();
  if (!mode && (fromOff || !fromOn)) std::abort();
  return 0;
}
