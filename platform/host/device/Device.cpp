#include "platform/host/device/Device.h"

#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>

#include "platform/posix/Descriptor.h"
#include "platform/posix/Utf8.h"

namespace host {
namespace {

constexpr int kBadProfile = 255;
constexpr std::size_t kLargestProfile = 1 << 20;

[[noreturn]] void refuse(const std::string& why) {
  complain(why);
  std::exit(kBadProfile);
}

std::string readProfileText(const std::string& file) {
  errno = 0;
  std::ifstream stream(file, std::ios::binary);
  std::string text(kLargestProfile + 1, '\0');
  stream.read(text.data(), static_cast<std::streamsize>(text.size()));
  if (!stream.eof()) {
    refuse(file + ":0: " + (stream.fail() ? strerror(errno) : "larger than a profile may be"));
  }
  text.resize(static_cast<std::size_t>(stream.gcount()));
  return text;
}

Profile* loadProfile() {
  auto* const profile = new Profile;
  const char* const file = std::getenv("ZUB_DEVICE");
  if (!file || !*file) return profile;
  profile->file = file;
  if (const auto wrong = parseProfile(readProfileText(file), file, *profile)) refuse(*wrong);
  return profile;
}

}  // namespace

void complain(std::string_view message) {
  std::string repaired;
  std::string shown;
  for (auto rest = posix::asUtf8(message, repaired); !rest.empty();) {
    const auto before = rest;
    const char32_t code = posix::takeCodePoint(rest);
    if (code < 0x20 || (code >= 0x7F && code < 0xA0)) {
      constexpr auto kDigits = "0123456789abcdef";
      shown.append("\\x") += {kDigits[code / 16], kDigits[code % 16]};
    } else {
      shown += before.substr(0, before.size() - rest.size());
    }
  }
  static_cast<void>(posix::writeAll(STDERR_FILENO, shown + '\n'));
}

Profile& device() {
  static auto* const profile = loadProfile();  // never destroyed: other threads outlive exit
  return *profile;
}

}  // namespace host
