#include "platform/zub_client.h"

#include <map>
#include <mutex>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include "platform/host/device/Answers.h"
#include "platform/host/device/Device.h"
#include "platform/host/device/RequestLog.h"
#include "platform/posix/SignalsBlocked.h"

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

/// A connection to the simulated server, which reports the states of the profile's steps.
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

  void enterState(const std::string& entered) {
    const std::lock_guard lock(mutex);
    state = entered;
    if (eventsOn) reportState();
  }

  bool isServerRunning() {
    const std::lock_guard lock(mutex);
    return state == kServerStateStarted;
  }

 private:
  void reportState() {
    lumo::dict payload;
    payload.set(kKeyServerState, state);
    const auto [first, last] = handlers.equal_range(kEventServerStateChange);
    for (auto handler = first; handler != last; ++handler) {
      queue.async([call = handler->second, payload] { call(payload, dispatch::group::create()); });
    }
  }

  std::mutex mutex;
  std::multimap<std::string, EventHandler> handlers;
  bool eventsOn = true;
  std::string state;  ///< the last one that the server has reported; empty before the first
};

namespace {

/// Keeps every manager, and so its handlers, until exit, as the contract says of the handlers.
/// Never destroyed: queues outlive exit.
void keepForGood(const std::shared_ptr<Manager>& manager) {
  static auto* const mutex = new std::mutex;
  static auto* const managers = new std::vector<std::shared_ptr<Manager>>;
  const std::lock_guard lock(*mutex);
  managers->push_back(manager);
}

/// Plays the server's steps. Those of time 0 have happened when this returns.
void startServer(const std::shared_ptr<Manager>& manager) {
  const auto start = std::chrono::steady_clock::now();
  auto steps = host::device().server;
  auto next = steps.begin();
  for (; next != steps.end() && next->at.count() == 0; ++next) manager->enterState(next->state);
  steps.erase(steps.begin(), next);
  if (steps.empty()) return;
  const posix::SignalsBlocked onTheThread;
  std::thread([manager, start, steps] {
    for (const auto& step : steps) {
      std::this_thread::sleep_until(start + step.at);
      manager->enterState(step.state);
    }
  }).detach();
}

constexpr std::int32_t kNoSuchRequest = -1;
constexpr std::int32_t kNoThread = -2;

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

/// What is settled when a request arrives: the rest of its answer may take time.
struct Arrival {
  bool serverRuns;
  std::chrono::milliseconds delay;
};

/// Notes the request. Trace properties are settings of the device, answered without a server.
Arrival arrive(Manager& manager, const std::string& command, const lumo::dict& request) {
  host::recordRequest(command + " " + host::describe(request));
  const bool isDump = command == kCommandTraceDumpState;
  const bool serverRuns = manager.isServerRunning();
  return {serverRuns,
          isDump && serverRuns ? host::device().dumpDelay : std::chrono::milliseconds()};
}

TelephonyLumo::Result answer(const Arrival& arrival, const std::string& command,
                             const lumo::dict& request, lumo::object* reply) {
  if (command == kCommandGetTraceProperty) return answerTraceProperty(request, reply);
  if (!arrival.serverRuns) return {kResultServerNotRunning, "the server is not running"};
  if (command != kCommandTraceDumpState) return {kNoSuchRequest, "no such command"};
  const auto& device = host::device();
  return host::answerWith(device.dump, kKeyTimestampString, host::timestampOr(device.dumpTimestamp),
                          reply);
}

}  // namespace

std::shared_ptr<Manager> CreateManager(const std::string& /*name*/, dispatch::queue queue) {
  auto manager = std::make_shared<Manager>(std::move(queue));
  startServer(manager);
  return manager;
}

void RegisterEventHandler(std::shared_ptr<Manager> manager, const std::string& event,
                          EventHandler handler) {
  keepForGood(manager);
  manager->addHandler(event, std::move(handler));
}

void EventsOff(std::shared_ptr<Manager> manager) { manager->switchEvents(false); }

void EventsOn(std::shared_ptr<Manager> manager) { manager->switchEvents(true); }

TelephonyLumo::Result PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                                     const lumo::dict& request, lumo::object* reply) {
  const auto arrival = arrive(*manager, command, request);
  std::this_thread::sleep_for(arrival.delay);
  return answer(arrival, command, request, reply);
}

void PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                    Completion completion, const lumo::dict& request) {
  const auto arrival = arrive(*manager, command, request);
  // Held in one place, from which the queue's task takes it: it is released there, after its call.
  const auto held = std::make_shared<Completion>(std::move(completion));
  const auto complete = [held](const TelephonyLumo::Result& result, const lumo::object& reply) {
    std::exchange(*held, {})(result, reply);
  };
  const dispatch::block<void()> task = [=] {
    lumo::object reply;
    const auto result = answer(arrival, command, request, &reply);
    complete(result, reply);
  };
  if (arrival.delay.count() == 0) return manager->queue.async(task);
  const posix::SignalsBlocked onTheThread;
  try {
    std::thread([queue = manager->queue, delay = arrival.delay, task] {
      std::this_thread::sleep_for(delay);
      queue.async(task);
    }).detach();
  } catch (const std::system_error& failure) {
    const TelephonyLumo::Result result = {kNoThread, failure.what()};
    manager->queue.async([=] { complete(result, {}); });
  }
}

}  // namespace client
}  // namespace zub
