#include "platform/zub_client.h"

#include <unistd.h>

#include <map>
#include <mutex>
#include <new>
#include <thread>
#include <utility>
#include <vector>

#include "platform/host/device/Device.h"
#include "platform/host/device/Requests.h"
#include "platform/posix/Descriptor.h"
#include "platform/posix/Thread.h"

namespace zub {

const char* const kCommandGetTraceProperty = "GetTraceProperty";
const char* const kCommandTraceDumpState = "TraceDumpState";

const char* const kEventServerStateChange = "ServerStateChange";
const char* const kKeyServerState = "ServerState";
const char* const kServerStateStarted = "Started";

const char* const kKeyTraceName = "TraceName";
const char* const kTraceBaseband = "TraceBaseband";
const char* const kTraceSystemLogs = "TraceSystemLogs";
const char* const kKeyTracePropertyName = "TracePropertyName";
const char* const kKeyTraceEnabled = "TraceEnabled";
const char* const kKeyTraceHighTput = "TraceHighTput";
const char* const kKeyTraceMode = "TraceMode";
const char* const kKeyTracePropertyValue = "TracePropertyValue";
const char* const kUnknown = "Unknown";

const char* const kKeyTraceAction = "TraceAction";
const char* const kCollectBasebandLogs = "CollectBasebandLogs";
const char* const kCollectTelephonyLogs = "CollectTelephonyLogs";
const char* const kCollectTelephonyLogsWithCoredump = "CollectTelephonyLogsWithCoredump";
const char* const kKeyTraceDumpStateReason = "TraceDumpStateReason";
const char* const kKeyTraceDumpStatePerformCompression = "TraceDumpStatePerformCompression";
const char* const kKeyTraceUserConfirmation = "TraceUserConfirmation";
const char* const kKeyBasebandResetType = "BasebandResetType";
const char* const kBasebandResetTypeHard = "BasebandResetTypeHard";
const char* const kKeyBasebandResetSubType = "BasebandResetSubType";
const char* const kBasebandResetSubTypeOtherErrors = "BasebandResetSubTypeOtherErrors";
const char* const kKeyBasebandResetReason = "BasebandResetReason";
const char* const kKeyTimestampString = "TimestampString";

namespace client {

/// A connection to the simulated server.
class Manager {
 public:
  explicit Manager(dispatch::queue callbacks) : queue(std::move(callbacks)) {}

  const dispatch::queue queue;

  void addHandler(const std::string& event, EventHandler handler) {
    const std::lock_guard lock(mutex);
    handlers.emplace(event, std::move(handler));
  }

  void switchEvents(bool on) {
    const std::lock_guard lock(mutex);
    const bool wereOff = !eventsOn;
    eventsOn = on;
    if (on && wereOff && !state.empty()) reportState();
  }

  void enterState(std::string entered) noexcept {
    const std::lock_guard lock(mutex);
    state = std::move(entered);
    try {
      if (eventsOn) reportState();
    } catch (const std::bad_alloc&) {
      static_cast<void>(
          posix::writeAll(STDERR_FILENO, "Not enough memory for an event of the server\n"));
    }
  }

  bool isServerRunning() {
    const std::lock_guard lock(mutex);
    return state == kServerStateStarted;
  }

 private:
  void reportState() {
    lumo::dict payload = {{kKeyServerState, state}};
    const auto [first, last] = handlers.equal_range(kEventServerStateChange);
    for (auto handler = first; handler != last; ++handler) {
      queue.async([call = handler->second, payload]() mutable {
        call(std::move(payload), dispatch::group::create());
      });
    }
  }

  std::mutex mutex;
  std::multimap<std::string, EventHandler> handlers;
  bool eventsOn = true;
  std::string state;  ///< as the server last reported it; empty before the first
};

namespace {

/// Has the server report its states. Those of time 0 are reported when this returns.
void startServer(const std::shared_ptr<Manager>& manager) {
  const auto start = std::chrono::steady_clock::now();
  auto steps = host::device().server;
  auto next = steps.begin();
  for (; next != steps.end() && next->at.count() == 0; ++next) manager->enterState(next->state);
  steps.erase(steps.begin(), next);
  if (steps.empty()) return;
  posix::startThread([manager, start, steps = std::move(steps)]() mutable {
    for (auto& step : steps) {
      std::this_thread::sleep_until(start + step.at);
      manager->enterState(std::move(step.state));
    }
  }).detach();
}

constexpr std::int32_t kNoSuchRequest = -1;
constexpr std::int32_t kNoMemory = -2;

TelephonyLumo::Result answerTraceProperty(const lumo::dict& request, lumo::object* reply) {
  const auto& device = host::device();
  const struct {
    std::string_view trace;
    std::string_view property;
    const host::Answer& answer;
  } properties[] = {{kTraceSystemLogs, kKeyTraceMode, device.systemLogsMode},
                    {kTraceBaseband, kKeyTraceEnabled, device.basebandEnabled},
                    {kTraceBaseband, kKeyTraceHighTput, device.basebandHighThroughput}};
  for (const auto& [trace, property, answer] : properties) {
    if (lumo::dyn_cast_or_default(request.get(kKeyTraceName), "") == trace &&
        lumo::dyn_cast_or_default(request.get(kKeyTracePropertyName), "") == property) {
      return host::answerWith(answer, kKeyTracePropertyValue, answer.text, reply);
    }
  }
  return {kNoSuchRequest, "no such trace property"};
}

/// Records a request. Returns whether the server runs when it arrives.
bool arrive(Manager& manager, const std::string& command, const lumo::dict& request) {
  host::recordRequest(command + " " + host::describe(request));
  return manager.isServerRunning();
}

/// Answers a request, after the delay of a dump. Trace properties are settings of the device, and
/// need no server.
TelephonyLumo::Result answer(const std::string& command, const lumo::dict& request, bool serverRuns,
                             lumo::object* reply) {
  if (command == kCommandGetTraceProperty) return answerTraceProperty(request, reply);
  if (!serverRuns) return {kResultServerNotRunning, "the server is not running"};
  if (command != kCommandTraceDumpState) return {kNoSuchRequest, "no such command"};
  const auto& device = host::device();
  std::this_thread::sleep_for(device.dumpDelay);
  return host::answerWith(device.dump, kKeyTimestampString, host::timestampOr(device.dumpTimestamp),
                          reply);
}

/// The completion of a request and its arguments. `complete` calls and destroys the completion.
struct Pending {
  Completion completion;
  TelephonyLumo::Result result;
  lumo::object reply;

  void complete() { std::exchange(completion, {})(std::move(result), std::move(reply)); }
};

}  // namespace

std::shared_ptr<Manager> CreateManager(const std::string& /*name*/, dispatch::queue queue) {
  auto manager = std::make_shared<Manager>(std::move(queue));
  startServer(manager);
  return manager;
}

void RegisterEventHandler(std::shared_ptr<Manager> manager, const std::string& event,
                          EventHandler handler) {
  // Keeps the manager, and so its handlers. Never destroyed: queues outlive exit.
  static auto* const mutex = new std::mutex;
  static auto* const managers = new std::vector<std::shared_ptr<Manager>>;
  const std::lock_guard lock(*mutex);
  managers->push_back(manager);
  manager->addHandler(event, std::move(handler));
}

void EventsOff(std::shared_ptr<Manager> manager) { manager->switchEvents(false); }

void EventsOn(std::shared_ptr<Manager> manager) { manager->switchEvents(true); }

TelephonyLumo::Result PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                                     const lumo::dict& request, lumo::object* reply) {
  return answer(command, request, arrive(*manager, command, request), reply);
}

void PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                    Completion completion, const lumo::dict& request) {
  const auto pending = std::make_shared<Pending>();
  pending->completion = std::move(completion);
  manager->queue.async(
      [manager, pending, command, request, serverRuns = arrive(*manager, command, request)] {
        try {
          pending->result = answer(command, request, serverRuns, &pending->reply);
          // The states that the server has reported meanwhile come first.
          manager->queue.async([pending] { pending->complete(); });
        } catch (const std::bad_alloc&) {
          pending->result = {kNoMemory, "no memory"};
          pending->reply = {};
          pending->complete();
        }
      });
}

}  // namespace client
}  // namespace zub
