#include "platform/telephony.h"

#include <dirent.h>
#include <unistd.h>

#include <algorithm>
#include <climits>
#include <fstream>
#include <memory>
#include <optional>

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

/// The name of the process with the folder `process` of /proc, or nothing when it is a zombie. Its
/// file stat holds "PID (NAME) STATE ...", where the name may hold anything; see proc(5).
std::optional<std::string> nameOfRunning(const std::string& process) {
  std::string stat;
  std::getline(std::ifstream(process + "/stat"), stat, '\0');
  const auto start = stat.find('(') + 1;
  const auto end = stat.rfind(") ");
  if (start == 0 || end == std::string::npos) return std::nullopt;
  constexpr std::string_view kEnded = "ZXx";
  if (kEnded.find(stat[end + 2]) != std::string_view::npos) return std::nullopt;
  char program[PATH_MAX] = {};  // stays empty for another user's process
  static_cast<void>(!readlink((process + "/exe").c_str(), program, sizeof program - 1));
  return std::string(host::processName(std::string_view(stat).substr(start, end - start), program));
}

bool runsOnThisMachine(const std::string& name) {
  const std::unique_ptr<DIR, int (*)(DIR*)> folder(opendir("/proc"), closedir);
  if (!folder) return false;
  while (const dirent* const entry = readdir(folder.get())) {
    if (nameOfRunning(std::string("/proc/") + entry->d_name) == name) return true;
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
