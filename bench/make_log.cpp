// Writes a recorded log of any number of messages, alike in each run: make_log COUNT FILE

#include <array>
#include <charconv>
#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>

namespace {

constexpr std::uint64_t kBoot = 1'700'000'000'000'000;  // in microseconds since 1970
constexpr std::uint64_t kFirstPid = 400;
constexpr std::uint64_t kMicrosecondsApart = 500;

constexpr std::array<std::string_view, 8> kProcesses = {
    "Orvalind", "zub-helper", "voltd", "sshd", "cron", "NetworkManager", "modemd", "kworkerd"};

/// What differs from one message to the next.
struct Message {
  std::uint64_t number;
  std::string_view process;
  std::uint64_t pid;
};

void addField(std::string& log, std::string_view name, std::string_view value) {
  log.append(name).append("=").append(value).append("\n");
}

/// Appends an entry of some 400 bytes, with the fields that journalctl gives, in their usual order.
/// Texts of no interest are shorter than real ones, or so many fields would take twice that.
void addEntry(std::string& log, const Message& message) {
  const std::string number = std::to_string(message.number);
  const std::string pid = std::to_string(message.pid);
  const std::string process(message.process);
  const std::uint64_t sinceBoot = (message.number + 1) * kMicrosecondsApart;
  addField(log, "__CURSOR", "i=" + number);
  addField(log, "__REALTIME_TIMESTAMP", std::to_string(kBoot + sinceBoot));
  addField(log, "__MONOTONIC_TIMESTAMP", std::to_string(sinceBoot));
  addField(log, "_BOOT_ID", "9c41f0e2b7d84a0c8f3e5d6a7b1c2d3e");
  addField(log, "PRIORITY", "6");
  addField(log, "_TRANSPORT", "syslog");
  addField(log, "SYSLOG_FACILITY", "3");
  addField(log, "SYSLOG_IDENTIFIER", process);
  addField(log, "SYSLOG_PID", pid);
  addField(log, "_UID", "0");
  addField(log, "_GID", "0");
  addField(log, "_HOSTNAME", "phone");
  addField(log, "_CAP_EFFECTIVE", "0");
  addField(log, "_PID", pid);
  addField(log, "TID", std::to_string(message.pid + message.number % 4));
  addField(log, "_COMM", process);
  addField(log, "_EXE", "/usr/sbin/" + process);
  addField(log, "_SYSTEMD_CGROUP", "/s");
  addField(log, "_SYSTEMD_UNIT", process + ".service");
  addField(log, "_SYSTEMD_SLICE", "-.slice");
  addField(log, "_RUNTIME_SCOPE", "system");
  addField(log, "MESSAGE", "cell " + number + " measured");
  log += '\n';
}

bool writeLog(std::uint64_t count, std::FILE* file) {
  std::string text;
  for (std::uint64_t i = 0; i < count; ++i) {
    const std::size_t turn = i % kProcesses.size();
    text.clear();
    addEntry(text, {i, kProcesses[turn], kFirstPid + turn});
    if (std::fwrite(text.data(), 1, text.size(), file) != text.size()) return false;
  }
  return true;
}

}  // namespace

int main(int argc, char** argv) {
  std::uint64_t count = 0;
  const std::string_view number = argc == 3 ? argv[1] : "";
  const auto [stop, error] = std::from_chars(number.data(), number.data() + number.size(), count);
  if (number.empty() || error != std::errc() || stop != number.data() + number.size()) {
    std::fputs("usage: make_log COUNT FILE\n", stderr);
    return 2;
  }
  std::FILE* const file = std::fopen(argv[2], "wb");
  if (file == nullptr) {
    std::perror(argv[2]);
    return 1;
  }
  const bool written = writeLog(count, file);
  if (std::fclose(file) != 0 || !written) {
    std::perror(argv[2]);
    return 1;
  }
  return 0;
}
