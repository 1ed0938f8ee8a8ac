#include "platform/host/ProcessName.h"

namespace host {
namespace {

constexpr std::size_t kKernelLimit = 15;
constexpr std::string_view kDeleted = " (deleted)";

}  // namespace

std::string_view fileName(std::string_view path) { return path.substr(path.rfind('/') + 1); }

std::string_view processName(std::string_view comm, std::string_view exePath) {
  if (comm.size() != kKernelLimit) return comm;
  if (exePath.ends_with(kDeleted)) exePath.remove_suffix(kDeleted.size());
  const std::string_view file = fileName(exePath);
  return file.starts_with(comm) ? file : comm;
}

std::string_view truncatedByKernel(std::string_view name) { return name.substr(0, kKernelLimit); }

}  // namespace host
