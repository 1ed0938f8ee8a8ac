#pragma once

#include <cstdint>
#include <list>
#include <string>

/// The packaging of collected logs. The values are those of the server.
enum class CompressionMode : std::int32_t { none = 0, tarGz = 1, tar = 2 };

/// Parses "[nocompress|tar.gz|tar] [nonui] <reason>" from the word list `words`. Options may be in
/// any order and case and may repeat; the last packaging counts. The first other word is the
/// reason; words after it are ignored.
///
/// Stores the packaging in `mode`, true in `noUi` for "nonui", and always a `reason`. `mode` and
/// `noUi` stay as they are if there is no such option. Cannot fail.
void parseLogdumpOptions(std::list<std::string> words, CompressionMode& mode, std::string& reason,
                         bool& noUi);
