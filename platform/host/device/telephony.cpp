#include "platform/telephony.h"

#include <algorithm>
#include <filesystem>
#include <fstream>

#include "platform/host/ProcessName.h"
#include "platform/host/device/Device.h"

int TelephonyRadiosGetRadio() { return host::device().radio; }
int TelephonyRadiosGetProduct() { return host::device().product; }
int TelephonyRadiosGetRadioVendor() { return host::device().radioVendor; }
bool TelephonyCapabilitiesRadioDIAGSupportsQDSS() { return host::device().qdss; }
bool TelephonyUtilIsInternalBuild() { return host::device().build == host::Build::internal; }
bool TelephonyUtilIsCarrierBuild() { return host::device().build == host::Build::carrier; }

namespace tlu {
namespace {

namespace fs = std::filesystem;

/// Whether a process of this machine has that name; see proc(5) for what the files hold.
bool runsOnThisMachine(const std::string& name) {
  std::error_code failed;
  for (fs::directory_iterator entry("/proc", failed), end; !failed && entry != end;
       entry.increment(failed)) {
    std::string comm;
    if (!std::getline(std::ifstream(entry->path() / "comm"), comm)) continue;
    std::error_code hidden;  // the program file of another user's process
    const auto program = fs::read_symlink(entry->path() / "exe", hidden).string();
    if (host::processName(comm, program) == name) return true;
  }
  return false;
}

}  // namespace

bool isProcessRunning(const std::string& name) {
  const auto& device = host::device();
  if (std::ranges::find(device.processes, name) != device.processes.end()) return true;
  return device.hostProcesses && runsOnThisMachine(name);
}

}  // namespace tlu

namespace defaults::compression {

std::int32_t mode() { return host::device().compression; }
bool supported() { return host::device().compressionSupported; }

}  // namespace defaults::compression
