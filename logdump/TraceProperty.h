#pragma once

#include <cstdint>
#include <optional>
#include <string>

/// Parsers of the text value of a trace property.
///
/// A value is one of the words false, off, no, true, on, yes, full and lite, in any case, or an
/// integer in all of the text: optional white space, an optional sign, and digits, which are
/// hexadecimal after 0x, octal after 0, and otherwise decimal. No state; any thread.

/// The mode of a trace: 0 for off, 1 for on or full, 2 for lite, or a signed 32-bit integer; no
/// value for any other text.
std::optional<std::int32_t> ParseTraceMode(const std::string& value);

/// Sets `flag` to false for false, off, no and 0, and to true for the other words and 1. Any other
/// text leaves it unchanged.
void parseBoolProperty(const std::string& value, bool& flag);
