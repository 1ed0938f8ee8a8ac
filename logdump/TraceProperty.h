#pragma once

#include <cstdint>
#include <optional>
#include <string>

/// Readings of the text value of a trace property.
///
/// A value is one of the words false, off, no, true, on, yes, full and lite, in any case, or a
/// whole number, all of the text: white space, a sign, and then digits, hexadecimal after 0x or 0X,
/// octal after 0, else decimal. Pure functions, any thread.

/// The mode of a trace: 0 off, 1 on or full, 2 lite, or any other signed 32-bit number; none for
/// any other text.
std::optional<std::int32_t> ParseTraceMode(const std::string& value);

/// Sets `flag` for a word (full and lite are on) or for the numbers 0 and 1; any other text leaves
/// it as it was.
void parseBoolProperty(const std::string& value, bool& flag);
