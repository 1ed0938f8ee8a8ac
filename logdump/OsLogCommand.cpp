#include "logdump/OsLogCommand.h"

#include <algorithm>
#include <cstdlib>
#include <iostream>
#include <limits>

#include "framework/WordList.h"
#include "oslog/OsLogStream.h"

namespace {

using Words = std::list<std::string>;

/// The integer at the start of `word`, or 0, clamped to the signed 32-bit range.
double ReadSeconds(const std::string& word) {
  using Range = std::numeric_limits<std::int32_t>;
  const long long number = std::strtoll(word.c_str(), nullptr, 10);
  return static_cast<double>(std::clamp<long long>(number, Range::min(), Range::max()));
}

/// Collects the words after "-p" and "-i". Words before these or after another option are ignored.
void ParseSelection(Words words, Words& processes, Words& imagePaths) {
  Words* chosen = nullptr;
  while (!words.empty()) {
    auto word = TakeNextWord(words);
    if (word == "-p") {
      chosen = &processes;
    } else if (word == "-i") {
      chosen = &imagePaths;
    } else if (word.starts_with('-')) {
      chosen = nullptr;
    } else if (chosen) {
      chosen->push_back(std::move(word));
    }
  }
}

bool ExportLog(Words words) {
  if (words.size() < 2) {
    std::cout << "os log collection: Failed" << std::endl;
    return false;
  }
  const double history = ReadSeconds(TakeNextWord(words));
  const auto path = TakeNextWord(words);
  Words processes;
  Words imagePaths;
  if (words.empty()) {
    processes = {"Orvalind",
                 "OrvalindMobileHelper",
                 "OrvalindRootHelper",
                 "zub-helper",
                 "Spectrumd",
                 "qel.Diagplug.Cellular",
                 "voltd"};
    imagePaths = {"Modemcore"};
  } else {
    ParseSelection(std::move(words), processes, imagePaths);
  }
  return OsLogStream::putOsLogStreamToFile(path, processes, imagePaths, history);
}

}  // namespace

CommandHandler OsLogHandler() {
  return [](const dispatch::group& group, const Words& words) {
    const dispatch::membership exporting(group);
    return ExportLog(words);
  };
}
