// Any words after a collection's name, and the path that its logs get.

#include <cstdint>
#include <cstdlib>

#include "framework/WordList.h"
#include "logdump/LogdumpOptions.h"
#include "logdump/TraceNames.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);
  auto mode = CompressionMode::tar;
  std::string reason;
  bool noUi = false;
  parseLogdumpOptions(convertLineToList(text), mode, reason, noUi);
  const auto path = buildLogPath(text, mode, "-suffix");
  const bool isGood = mode >= CompressionMode::none && mode <= CompressionMode::tar &&
                      reason.starts_with("[zubtool] ") && path.find(text) != std::string::npos &&
                      path.ends_with("-suffix") == (mode == CompressionMode::none);
  if (!isGood) std::abort();
  return 0;
}
