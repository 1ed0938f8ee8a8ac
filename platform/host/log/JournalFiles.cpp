#include "platform/host/log/JournalFiles.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/resource.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <fstream>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string_view>
#include <system_error>
#include <utility>

#include "platform/posix/Utf8.h"

namespace host {
namespace {

namespace fs = std::filesystem;

constexpr const char* kMachineIdFile = "/etc/machine-id";
constexpr const char* kVolatileFolder = "/run/log/journal";
constexpr const char* kKeptFolder = "/var/log/journal";

/// The 32 small hexadecimal digits of a machine ID, written with dashes or without; empty for other
/// texts.
std::string machineId(std::string_view text) {
  constexpr std::size_t kDigits = 32;
  std::string id;
  for (const char letter : text) {
    if (letter != '-') id += posix::lowered(letter);
  }
  const bool isOne =
      id.size() == kDigits && id.find_first_not_of("0123456789abcdef") == std::string::npos;
  return isOne ? id : "";
}

[[noreturn]] void refuseUnreadable(const fs::path& path, const std::error_code& error) {
  std::string what = "Cannot read the journal: " + path.string() + ": " + error.message();
  if (error == std::errc::permission_denied || error == std::errc::operation_not_permitted) {
    what += ". Run as root or as a member of the group systemd-journal";
  }
  throw std::runtime_error(what);
}

/// What is in a folder, itself and the one above it included; nothing where there is no such
/// folder. Read with the C library: an iterator of the C++ library ends the process for want of
/// memory.
std::vector<fs::path> entriesOf(const fs::path& folder) {
  const std::unique_ptr<DIR, int (*)(DIR*)> opened(::opendir(folder.c_str()), ::closedir);
  if (!opened && errno == ENOENT) return {};
  std::vector<fs::path> entries;
  while (opened) {
    errno = 0;
    const dirent* const entry = ::readdir(opened.get());
    if (entry == nullptr) break;
    entries.push_back(folder / entry->d_name);
  }
  if (errno != 0) refuseUnreadable(folder, {errno, std::generic_category()});
  return entries;
}

/// `folder` and those below it that are called by machine IDs, or by `onlyId`.
void addFolders(const fs::path& folder, const std::optional<std::string>& onlyId,
                std::vector<fs::path>& folders) {
  folders.push_back(folder);
  for (const fs::path& entry : entriesOf(folder)) {
    const std::string id = machineId(entry.filename().string());
    std::error_code unknown;
    if (id.empty() || (onlyId && id != *onlyId)) continue;
    if (fs::is_directory(entry, unknown) || unknown) folders.push_back(entry);
  }
}

std::vector<fs::path> foldersOf(const std::string& journal) {
  std::vector<fs::path> folders;
  if (journal.empty()) {
    std::string text;
    std::getline(std::ifstream(kMachineIdFile), text);
    const std::string id = machineId(text);
    if (id.empty()) {
      throw std::runtime_error(std::string("No journal: ") + kMachineIdFile + " names no machine");
    }
    addFolders(kVolatileFolder, std::nullopt, folders);
    addFolders(kKeptFolder, id, folders);
  } else if (fs::is_directory(journal)) {
    addFolders(journal, std::nullopt, folders);
  }
  return folders;
}

/// The paths of the files, of which some may be gone by now.
std::vector<fs::path> filesOf(const std::string& journal) {
  const std::vector<fs::path> folders = foldersOf(journal);
  if (folders.empty()) return {journal};
  std::vector<fs::path> files;
  for (const fs::path& folder : folders) {
    for (const fs::path& entry : entriesOf(folder)) {
      const fs::path ending = entry.extension();
      std::error_code unknown;
      const fs::file_status status = fs::symlink_status(entry, unknown);
      if (ending != ".journal" && ending != ".journal~") continue;
      if (unknown || fs::is_regular_file(status) || fs::is_symlink(status)) files.push_back(entry);
    }
  }
  return files;
}

/// What distinguishes a file from all others, whatever its name.
using Identity = std::pair<dev_t, ino_t>;

std::optional<Identity> identityOf(const fs::path& path) {
  struct stat about = {};
  if (::stat(path.c_str(), &about) != 0) return std::nullopt;
  return Identity(about.st_dev, about.st_ino);
}

using Identities = std::vector<Identity>;

Identities identitiesOf(const std::vector<fs::path>& paths) {
  Identities identities;
  for (const fs::path& path : paths) {
    if (const auto identity = identityOf(path)) identities.push_back(*identity);
  }
  std::ranges::sort(identities);
  return identities;
}

/// A journal may have more files than the common soft limit, 1,024, lets a process open.
void raiseDescriptorLimit() {
  rlimit limit = {};
  if (::getrlimit(RLIMIT_NOFILE, &limit) != 0) return;
  limit.rlim_cur = limit.rlim_max;
  ::setrlimit(RLIMIT_NOFILE, &limit);
}

std::vector<JournalFile> openAll(const std::vector<fs::path>& paths) {
  std::vector<JournalFile> files;
  for (const fs::path& path : paths) {
    posix::Descriptor opened(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    const std::error_code failure(errno, std::generic_category());
    const bool isGone = failure == std::errc::no_such_file_or_directory && !fs::is_symlink(path);
    if (opened) {
      files.push_back({path, std::move(opened)});
    } else if (!isGone) {
      refuseUnreadable(path, failure);
    }
  }
  return files;
}

/// The folder that holds the file at `path`, or would hold one made there: links that lead nowhere
/// yet are followed.
fs::path folderOf(fs::path path) {
  constexpr int kMostLinks = 40;
  for (int links = 0; links < kMostLinks && fs::is_symlink(path); ++links) {
    path = path.parent_path() / fs::read_symlink(path);
  }
  return path.has_parent_path() ? path.parent_path() : ".";
}

}  // namespace

std::vector<JournalFile> openJournalFiles(const std::string& journal) {
  raiseDescriptorLimit();
  std::vector<JournalFile> files;
  Identities before;
  do {
    const std::vector<fs::path> paths = filesOf(journal);
    before = identitiesOf(paths);
    files = openAll(paths);
  } while (identitiesOf(filesOf(journal)) != before);
  if (!files.empty()) return files;
  if (!journal.empty()) throw std::runtime_error("No journal: no journal files in " + journal);
  throw std::runtime_error(std::string("No journal: no journal files in ") + kKeptFolder + " or " +
                           kVolatileFolder + ". Is systemd-journald running?");
}

bool isOfJournal(const std::string& journal, const std::string& path) try {
  const auto folder = identityOf(folderOf(path));
  const auto file = identityOf(path);
  const auto isOneOf = [](const std::optional<Identity>& identity, const Identities& all) {
    return identity && std::ranges::binary_search(all, *identity);
  };
  return isOneOf(folder, identitiesOf(foldersOf(journal))) ||
         isOneOf(file, identitiesOf(filesOf(journal)));
} catch (const std::exception&) {
  return true;
}

}  // namespace host
