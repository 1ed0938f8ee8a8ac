// Every service of a device, each answering as its header says when it is not there. The tool
// builds with this port and refuses to start, for the product has no radio.

#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <mutex>

#include "platform/oslog_store.h"
#include "platform/posix/Descriptor.h"
#include "platform/system.h"
#include "platform/telephony.h"
#include "platform/zub_client.h"
#include "platform/zub_helper.h"

// system.h

const char* getprogname() { return program_invocation_short_name; }

void platform::runMainEventLoop() {
  for (;;) pause();
}

void platform::logError(const std::string& message) { syslog(LOG_ERR, "%s", message.c_str()); }

bool posix::isReadByDevice(const std::string& /*path*/) { return false; }

// telephony.h

int TelephonyRadiosGetRadio() { return 0; }
int TelephonyRadiosGetProduct() { return 0; }
int TelephonyRadiosGetRadioVendor() { return 0; }
bool TelephonyCapabilitiesRadioDIAGSupportsQDSS() { return false; }
bool TelephonyUtilIsInternalBuild() { return false; }
bool TelephonyUtilIsCarrierBuild() { return false; }
bool tlu::isProcessRunning(const std::string& /*name*/) { return false; }
std::int32_t defaults::compression::mode() { return 0; }
bool defaults::compression::supported() { return false; }

// zub_client.h: the texts of the names are the client library's

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

class Manager {
 public:
  dispatch::queue queue;
};

std::shared_ptr<Manager> CreateManager(const std::string& /*name*/, dispatch::queue queue) {
  return std::make_shared<Manager>(Manager{std::move(queue)});
}

void RegisterEventHandler(std::shared_ptr<Manager> /*manager*/, const std::string& /*event*/,
                          EventHandler handler) {
  static auto* const mutex = new std::mutex;  // never destroyed: other threads outlive exit
  static auto* const kept = new std::vector<EventHandler>;
  const std::lock_guard lock(*mutex);
  kept->push_back(std::move(handler));
}

void EventsOff(std::shared_ptr<Manager> /*manager*/) {}
void EventsOn(std::shared_ptr<Manager> /*manager*/) {}

TelephonyLumo::Result PerformCommand(std::shared_ptr<Manager> /*manager*/,
                                     const std::string& /*command*/, const lumo::dict& /*request*/,
                                     lumo::object* /*reply*/) {
  return {kResultServerNotRunning, "there is no server"};
}

void PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                    Completion completion, const lumo::dict& request) {
  manager->queue.async([manager, command, completion = std::move(completion), request] {
    lumo::object reply;
    const auto result = PerformCommand(manager, command, request, &reply);
    completion(result, reply);
  });
}

}  // namespace client

// zub_helper.h

namespace helper {

const char* const kCommandSysreportStatus = "SysreportStatus";
const char* const kKeyTimeout = "Timeout";
const char* const kKeyTimestampString = "TimestampString";

}  // namespace helper

std::shared_ptr<HelperClient> HelperClient::create(const std::string& /*name*/,
                                                   std::shared_ptr<tlu::LogServer> /*logServer*/) {
  return nullptr;
}

}  // namespace zub

// oslog_store.h

namespace {

class NoStore final : public OSLogEventStore {
 public:
  void prepareWithCompletionHandler(PrepareHandler handler) override {
    handler(nullptr, "there is no log store");
  }
};

}  // namespace

std::shared_ptr<OSLogEventStore> OSLogEventStore::localStore() {
  return std::make_shared<NoStore>();
}

std::shared_ptr<OSLogEventStream> OSLogEventStream::initWithSource(
    std::shared_ptr<OSLogEventSource> /*source*/) {
  return nullptr;
}
