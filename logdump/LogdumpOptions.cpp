#include "logdump/LogdumpOptions.h"

#include "framework/WordList.h"
#include "platform/telephony.h"

namespace {

/// Starts each reason, so that readers of the server's logs see who asked.
constexpr auto kReasonPrefix = "[zubtool] ";
constexpr auto kDefaultReason = "[zubtool] User triggered";

}  // namespace

void parseLogdumpOptions(std::list<std::string> words, CompressionMode& mode, std::string& reason,
                         bool& noUi) {
  reason = kDefaultReason;
  while (!words.empty()) {
    const auto word = TakeNextWord(words);
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
