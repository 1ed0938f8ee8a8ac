#include "platform/host/log/Journal.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <optional>
#include <stdexcept>
#include <string_view>
#include <system_error>

#include "platform/host/ProcessName.h"
#include "platform/host/log/JournalProcess.h"
#include "platform/posix/Descriptor.h"

namespace host {
namespace {

namespace fs = std::filesystem;

constexpr const char* kMachineIdFile = "/etc/machine-id";
constexpr std::size_t kMachineIdLength = 32;

bool isMachineId(std::string_view text) {
  return text.size() == kMachineIdLength &&
         text.find_first_not_of("0123456789abcdef") == std::string_view::npos;
}

[[noreturn]] void refuseUnreadable(const fs::path& path, const std::error_code& error) {
  std::string what = "Cannot read the journal: " + path.string() + ": " + error.message();
  if (error == std::errc::permission_denied || error == std::errc::operation_not_permitted) {
    what += ". Run as root or as a member of the group systemd-journal";
  }
  throw std::runtime_error(what);
}

/// The entries of a folder; none where there is no such folder.
std::vector<fs::path> entriesOf(const fs::path& folder) {
  std::vector<fs::path> paths;
  std::error_code error;
  fs::directory_iterator entry(folder, error);
  for (; !error && entry != fs::directory_iterator(); entry.increment(error)) {
    paths.push_back(entry->path());
  }
  if (error && error != std::errc::no_such_file_or_directory) refuseUnreadable(folder, error);
  return paths;
}

bool isJournalFile(const fs::path& path) {
  return path.extension() == ".journal" || path.extension() == ".journal~";
}

/// The number of journal files among `paths`, each of which can be opened or has just gone.
std::size_t countReadable(const std::vector<fs::path>& paths) {
  std::size_t count = 0;
  for (const fs::path& path : paths) {
    if (!isJournalFile(path)) continue;
    const posix::Descriptor file(
        ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    if (file) {
      ++count;
    } else if (errno != ENOENT) {
      refuseUnreadable(path, {errno, std::generic_category()});
    }
  }
  return count;
}

void checkFilesOfMachine() {
  std::string id;
  std::getline(std::ifstream(kMachineIdFile), id);
  if (!isMachineId(id)) {
    throw std::runtime_error(std::string("No journal: ") + kMachineIdFile + " names no machine");
  }
  const fs::path kept = fs::path("/var/log/journal") / id;
  const fs::path volatileOnes = fs::path("/run/log/journal") / id;
  if (countReadable(entriesOf(kept)) + countReadable(entriesOf(volatileOnes)) == 0) {
    throw std::runtime_error("No journal: no journal files in " + kept.string() + " or " +
                             volatileOnes.string() + ". Is systemd-journald running?");
  }
}

/// A folder may hold the files themselves, and those of machines in folders called after them.
void checkFilesIn(const fs::path& folder) {
  const std::vector<fs::path> paths = entriesOf(folder);
  std::size_t count = countReadable(paths);
  for (const fs::path& path : paths) {
    std::error_code error;
    if (isMachineId(path.filename().string()) && fs::is_directory(path, error)) {
      count += countReadable(entriesOf(path));
    }
  }
  if (count == 0) throw std::runtime_error("No journal: no journal files in " + folder.string());
}

std::vector<std::string> commonArguments(const std::string& folder) {
  std::vector<std::string> arguments = {"--quiet", "--no-pager", "--output=export"};
  if (!folder.empty()) arguments.push_back("--directory=" + folder);
  return arguments;
}

/// A name that the index can be asked for as it stands. A name that is not plain may be that of an
/// event whose fields hold other bytes, which were not UTF-8.
bool isPlain(const std::string& name) {
  return !name.empty() &&
         std::ranges::all_of(name, [](char byte) { return byte > ' ' && byte <= '~'; });
}

}  // namespace

void checkJournalFiles(const std::string& folder) {
  if (folder.empty()) {
    checkFilesOfMachine();
  } else {
    checkFilesIn(folder);
  }
}

void checkJournalctl(const std::string& folder, std::chrono::milliseconds patience) {
  std::vector<std::string> arguments = commonArguments(folder);
  arguments.emplace_back("--lines=0");
  std::optional<JournalProcess> process;
  try {
    process.emplace(arguments);
  } catch (const std::system_error& error) {
    if (error.code() == std::errc::no_such_file_or_directory) {
      throw std::runtime_error("Cannot read the journal: journalctl is not installed");
    }
    throw std::runtime_error(std::string("Cannot start journalctl: ") + error.what());
  }
  const std::optional<bool> answer = process->succeeded(patience);
  if (!answer) {
    throw std::runtime_error("journalctl has not answered within " +
                             std::to_string(patience.count()) + " ms");
  }
  if (!*answer) {
    std::string said = process->messages();
    said.resize(std::min(said.size(), said.find('\n')));
    throw std::runtime_error("journalctl failed: " + (said.empty() ? "it does not say why" : said));
  }
}

std::vector<std::string> exportArguments(const std::string& folder, OSLogDate from,
                                         const EventFilter& filter) {
  constexpr std::int64_t kMicrosecondsASecond = 1'000'000;
  std::vector<std::string> arguments = commonArguments(folder);
  const std::int64_t since = from.microsecondsSince1970() / kMicrosecondsASecond;
  if (since > 0) arguments.push_back("--since=@" + std::to_string(since));

  const auto names = filter.processes();
  if (!names || names->empty() || !std::ranges::all_of(*names, isPlain)) return arguments;
  for (const std::string& name : *names) {
    arguments.push_back("_COMM=" + std::string(truncatedByKernel(name)));
  }
  arguments.emplace_back("+");
  for (const std::string& name : *names) arguments.push_back("SYSLOG_IDENTIFIER=" + name);
  return arguments;
}

}  // namespace host
