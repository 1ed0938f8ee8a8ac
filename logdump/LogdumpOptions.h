#pragma once

#include <cstdint>
#include <list>
#include <string>

/// How collected logs are packaged. Sent to the server as a 64-bit integer.
enum class CompressionMode : std::int32_t { none = 0, tarGz = 1, tar = 2 };

/// Reads "[nocompress|tar.gz|tar] [nonui] <reason>" from the word list `words`. The option words
/// come in any order and case, and may repeat; the first other word is the reason and ends the
/// reading.
///
/// `mode` and `noUi` keep what the caller set where no option says otherwise; `reason` is always
/// set. Cannot fail.
void parseLogdumpOptions(std::list<std::string> words, CompressionMode& mode, std::string& reason,
                         bool& noUi);
