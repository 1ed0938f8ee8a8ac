#include "logdump/LogdumpOptions.h"

#include "framework/WordList.h"
#include "logdump/TraceNames.h"
#include "platform/telephony.h"

namespace {

/// The text in front of each reason, by which the server's users tell who asked.
constexpr auto kReasonPrefix = "[zubtool] ";
constexpr auto kDefaultReason = "[zubtool] User triggered";

/// The extension of an archive of that mode; `defaultSuffix` where there is none.
std::string extensionOf(CompressionMode mode, const std::string& defaultSuffix) {
  switch (mode) {
    case CompressionMode::tarGz:
      return std::string(".") + zub::trace::kLogTarGzExtension;
    case CompressionMode::tar:
      return std::string(".") + zub::trace::kLogTarExtension;
    default:
      return defaultSuffix;
  }
}

}  // namespace

void parseLogdumpOptions(std::list<std::string> words, CompressionMode& mode, std::string& reason,
                         bool& noUi) {
  reason = kDefaultReason;
  while (!words.empty()) {
    const auto word = takeNextWord(words);
    if (util::equal_nocase(word, "nocompress")) {
      mode = CompressionMode::none;
    } else if (util::equal_nocase(word, "tar.gz")) {
      mode = CompressionMode::tarGz;
    } else if (util::equal_nocase(word, "tar")) {
      mode = CompressionMode::tar;
    } else if (util::equal_nocase(word, "nonui")) {
      noUi = true;
    } else {
      reason = kReasonPrefix + word;
      return;
    }
  }
}

std::string buildLogPath(const std::string& timestamp, CompressionMode mode,
                         const std::string& defaultSuffix) {
  return std::string(zub::trace::kSnapshotFolder) + zub::trace::kLogDirPrefix + timestamp +
         extensionOf(mode, defaultSuffix);
}
