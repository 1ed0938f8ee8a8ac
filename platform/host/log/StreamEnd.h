#pragma once

/// The reasons, besides kOSLogEventStreamEndOfLog, with which the streams of this store end.
namespace host {

/// The stream was asked to stop.
inline constexpr unsigned long kStreamInvalidated = 1;

/// The log is damaged or cut off. All that stood whole before that has been delivered.
inline constexpr unsigned long kStreamDamaged = 2;

/// The log, or the rest of it, could not be read: an error of a file or of the journal's library,
/// or too little memory or no thread for it.
inline constexpr unsigned long kStreamUnreadable = 3;

}  // namespace host
