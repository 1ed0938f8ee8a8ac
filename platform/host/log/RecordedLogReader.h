#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <optional>

#include "platform/host/log/EntryReader.h"

namespace host {

/// The size of the buffer of a reader of recorded logs.
inline constexpr std::size_t kRecordedLogBuffer = std::size_t{256} << 10;

/// Puts the next bytes of the log, at most `size` (which is not 0), into `buffer`, and returns
/// their number: 0 at the end, nothing when the reader has been asked to stop. May block. Throws
/// `std::system_error` when the rest cannot be read. Called again only after a number above 0.
using ReadBytes = std::function<std::optional<std::size_t>(char* buffer, std::size_t size)>;

/// A reader of a log in the Journal Export Format, which may be of any bytes at all.
///
/// An entry ends with an empty line. A log that stops anywhere else, even after the line of a
/// field, is cut off: its last entry is dropped, and its end is damage. A log of no bytes is
/// complete.
///
/// Damage is also: a field name that is empty, longer than 255 bytes, or not of A-Z, 0-9 and _;
/// wanted fields longer than an entry may have; a binary field without a newline after it.
///
/// Skipped silently: an entry without a valid date and, between entries, empty lines and lines that
/// start with "-- ", which journalctl writes at a reboot.
///
/// Memory is one buffer, and the wanted fields of one entry.
std::unique_ptr<EntryReader> readRecordedLog(ReadBytes readBytes);

}  // namespace host
