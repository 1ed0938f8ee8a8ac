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

/// Names of the protocol of the baseband manager server. The client library defines them.
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
/// time. They must not throw. Errors: a request that fails has the error in its result, also when
/// there is no memory for the answer. An event for which there is no memory is lost. A call for
/// which there is no memory or no thread throws `std::bad_alloc` or `std::system_error`.
namespace zub::client {

/// The connection of a client to the server. Opaque.
class Manager;

/// Takes the payload of an event, which may be null, and a group that belongs to the library.
using EventHandler = dispatch::block<void(lumo::object payload, dispatch::group)>;

/// Takes the result of a request and its reply, a dictionary on success.
using Completion = dispatch::block<void(TelephonyLumo::Result result, lumo::object reply)>;

/// Makes a manager for the client called `name`, with callbacks on `queue`. Never null. Delivery of
/// events is on.
std::shared_ptr<Manager> CreateManager(const std::string& name, dispatch::queue queue);

/// Calls `handler` for each later event called `event`. The library keeps the handler until the
/// process exits.
void RegisterEventHandler(std::shared_ptr<Manager> manager, const std::string& event,
                          EventHandler handler);

/// Stops the delivery of events. Those that occur meanwhile are lost.
void EventsOff(std::shared_ptr<Manager> manager);

/// Starts the delivery of events. A server that has reported a state then reports it again. Does
/// nothing when delivery is on.
void EventsOn(std::shared_ptr<Manager> manager);

/// Sends `command` with `request` and blocks until the answer comes, without a time-out. `*reply`
/// must be the null object; it receives the reply of a request that succeeded.
TelephonyLumo::Result PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                                     const lumo::dict& request, lumo::object* reply);

/// Sends `command` with `request` and returns at once. `completion` runs once, on the manager's
/// queue, and is destroyed before the next task of that queue starts.
void PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                    Completion completion, const lumo::dict& request);

}  // namespace zub::client
