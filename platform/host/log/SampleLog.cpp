#include "platform/host/log/SampleLog.h"

#include <array>
#include <string_view>

namespace host {
namespace {

struct SampleEvent {
  int secondsAgo;
  std::string_view process;
  int pid;
  int thread;
  int activity;
  int type;
  std::string_view image;
  std::string_view subsystem;
  std::string_view category;
  std::string_view message;
};

constexpr int kLogMessage = kOSLogEventTypeLogMessage;
constexpr int kStateChange = 768;  // of no interest to who wants messages

constexpr auto kEvents = std::to_array<SampleEvent>({
    {480, "Orvalind", 112, 0x3a1, 0, kLogMessage, "/usr/sbin/Orvalind", "telephony.registration",
     "network", "Registered on 262-02, LTE band 20"},
    {300, "voltd", 131, 0x51c, 0x8001, kLogMessage, "/usr/sbin/voltd", "telephony.voice", "ims",
     "IMS registration renewed for 3600 s"},
    {240, "Orvalind", 112, 0x3a4, 0, kLogMessage, "/usr/lib/modemcore/libcommand.so", "modem",
     "transport", "Boot stage 4 after 812 ms"},
    {120, "backupd", 208, 0x77e, 0, kLogMessage, "/usr/sbin/backupd", "storage.backup", "schedule",
     "Next backup in 21600 s"},
    {60, "radiotest", 291, 0x90b, 0, kLogMessage, "/usr/lib/modemcore/libtrace.so", "modem",
     "trace", "Trace buffer at 37 %"},
    {30, "Orvalind", 112, 0x3a1, 0x8002, kStateChange, "/usr/sbin/Orvalind",
     "telephony.registration", "network", "Idle"},
    {15, "zub-helper", 140, 0x1a, 0, kLogMessage, "/usr/libexec/zub-helper", "diagnostics",
     "request", "Ready for requests"},
    {5, "Orvalind", 112, 0x3a1, 0x8002, kLogMessage, "/usr/sbin/Orvalind", "telephony.registration",
     "signal", "Signal −97 dBm, 3 bars"},
});

void addField(std::string& log, std::string_view name, std::string_view value) {
  log.append(name).append("=").append(value).append("\n");
}

}  // namespace

std::string sampleLog(OSLogDate now) {
  std::string log;
  for (const SampleEvent& event : kEvents) {
    const OSLogDate date = now.addingSeconds(-event.secondsAgo);
    addField(log, "__REALTIME_TIMESTAMP", std::to_string(date.microsecondsSince1970()));
    addField(log, "LOG_TYPE", std::to_string(event.type));
    addField(log, "TID", std::to_string(event.thread));
    addField(log, "LOG_ACTIVITY", std::to_string(event.activity));
    addField(log, "_PID", std::to_string(event.pid));
    addField(log, "_COMM", event.process);
    addField(log, "LOG_SENDER_PATH", event.image);
    addField(log, "LOG_SUBSYSTEM", event.subsystem);
    addField(log, "LOG_CATEGORY", event.category);
    addField(log, "MESSAGE", event.message);
    log += '\n';
  }
  return log;
}

}  // namespace host
