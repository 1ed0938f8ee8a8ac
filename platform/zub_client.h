#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "platform/dispatch.h"
#include "platform/lumo.h"

namespace TelephonyLumo {

/// The outcome of a request to the server or to the helper service.
struct Result {
  std::int32_t code = 0;  ///< 0 for success
  std::string message;    ///< for a person; empty on success
};

}  // namespace TelephonyLumo

/// Names of the baseband manager server's protocol. The client library defines these objects and
/// their texts.
namespace zub {

extern const char* const kCommandGetTraceProperty;
extern const char* const kCommandTraceDumpState;

extern const char* const kEventServerStateChange;
extern const char* const kKeyServerState;
extern const char* const kServerStateStarted;

extern const char* const kKeyTraceName;
extern const char* const kTraceBaseband;
extern const char* const kTraceSystemLogs;
extern const char* const kKeyTracePropertyName;
extern const char* const kKeyTraceEnabled;
extern const char* const kKeyTraceHighTput;
extern const char* const kKeyTraceMode;
extern const char* const kKeyTracePropertyValue;
extern const char* const kUnknown;

extern const char* const kKeyTraceAction;
extern const char* const kCollectBasebandLogs;
extern const char* const kCollectTelephonyLogs;
extern const char* const kCollectTelephonyLogsWithCoredump;
extern const char* const kKeyTraceDumpStateReason;
extern const char* const kKeyTraceDumpStatePerformCompression;
extern const char* const kKeyTraceUserConfirmation;
extern const char* const kKeyBasebandResetType;
extern const char* const kBasebandResetTypeHard;
extern const char* const kKeyBasebandResetSubType;
extern const char* const kBasebandResetSubTypeOtherErrors;
extern const char* const kKeyBasebandResetReason;
extern const char* const kKeyTimestampString;

/// The code of a server request that found no server running.
inline constexpr auto kResultServerNotRunning = static_cast<std::int32_t>(0xE020E001U);

}  // namespace zub

/// The client library of the baseband manager server.
///
/// Threads: handlers and completions run on the queue that the manager was made with, one at a
/// time. They must not throw. Errors: those of a request are in its result, which is a failure too
/// when there is no memory for the answer; an event for which there is none is lost. A call for
/// which there is no memory or no thread throws `std::bad_alloc` or `std::system_error`.
namespace zub::client {

/// One client's connection to the server. Opaque; shared by handle.
class Manager;

/// Receives an event's payload, which may be null, and a group of the library's own.
using EventHandler = dispatch::block<void(lumo::object payload, dispatch::group)>;

/// Receives the result of a request and its reply, a dictionary on success.
using Completion = dispatch::block<void(TelephonyLumo::Result result, lumo::object reply)>;

/// Makes a manager for the client called `name`, with callbacks on `queue`. Never null. Its events
/// are on, as after `EventsOn`.
std::shared_ptr<Manager> CreateManager(const std::string& name, dispatch::queue queue);

/// Calls `handler` for each event of that name from now on. The library keeps its reference to the
/// handler until the process exits; events that were reported before are not repeated.
void RegisterEventHandler(std::shared_ptr<Manager> manager, const std::string& event,
                          EventHandler handler);

/// Stops the delivery of events. Those that occur until it is started again are lost.
void EventsOff(std::shared_ptr<Manager> manager);

/// Starts the delivery of events. When they were off, a server that has reported a state reports
/// it anew; when they were on already, nothing happens.
void EventsOn(std::shared_ptr<Manager> manager);

/// Sends `command` with `request` and blocks until it is answered, without a time-out. `*reply`,
/// which is the caller's and comes in as the null object, holds the reply afterwards; a request
/// that failed leaves it null.
TelephonyLumo::Result PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                                     const lumo::dict& request, lumo::object* reply);

/// Sends `command` with `request` and returns at once. `completion` runs once, on the manager's
/// queue, and the library has released it before that queue takes its next task.
void PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                    Completion completion, const lumo::dict& request);

}  // namespace zub::client
