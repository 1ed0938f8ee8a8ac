// The export of a recorded log, against reading it once and appending each line with one write; and
// of one that is badly encoded, against one that is not.

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "bench/Ratio.h"
#include "oslog/OsLogStream.h"
#include "platform/host/device/Device.h"

namespace {

constexpr double kAllHistory = 2147483647;

/// A folder with a generated log, removed afterwards.
class Folder {
 public:
  explicit Folder(std::int64_t messages) {
    std::string name = std::filesystem::temp_directory_path() / "zubtool-bench-XXXXXX";
    if (!mkdtemp(name.data())) std::abort();
    path = name;
    const auto generate =
        std::string(ZUB_MAKE_LOG) + " " + std::to_string(messages) + " " + file("log");
    if (std::system(generate.c_str()) != 0) std::abort();
  }
  Folder(const Folder&) = delete;
  Folder& operator=(const Folder&) = delete;
  ~Folder() { std::filesystem::remove_all(path); }

  std::string file(const char* name) const { return path / name; }

 private:
  std::filesystem::path path;
};

std::vector<std::string> readLines(const std::string& file) {
  std::vector<std::string> lines;
  std::ifstream stream(file);
  for (std::string line; std::getline(stream, line);) lines.push_back(line + '\n');
  return lines;
}

void readAndAppend(const std::string& from, const std::string& to,
                   const std::vector<std::string>& lines) {
  const int in = open(from.c_str(), O_RDONLY);
  const int out = open(to.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_APPEND, 0600);
  std::vector<char> buffer(1 << 16);
  while (read(in, buffer.data(), buffer.size()) > 0) {
  }
  for (const auto& line : lines) {
    if (write(out, line.data(), line.size()) < 0) std::abort();
  }
  close(in);
  close(out);
}

/// The most memory that the program holds while it exports a log, in MiB. A child's peak counts
/// what it had of its parent, so this comes before anything that makes this process large.
double peakMemory(const Folder& folder) {
  std::ofstream(folder.file("device")) << "log = log\n";
  const pid_t child = fork();
  if (child == 0) {
    setenv("ZUB_DEVICE", folder.file("device").c_str(), 1);
    execl(ZUBTOOL_PROGRAM, "zubtool", "logdump", "oslog", "2147483647", folder.file("out").c_str(),
          "all", nullptr);
    _exit(127);
  }
  int status = 0;
  rusage usage{};
  wait4(child, &status, 0, &usage);
  if (status != 0) std::abort();
  return static_cast<double>(usage.ru_maxrss) / 1024;
}

void BM_Export(benchmark::State& state) {
  const Folder folder(state.range(0));
  host::device().log = folder.file("log");
  const auto exportAll = [&] {
    if (!OsLogStream::putOsLogStreamToFile(folder.file("out"), {}, {}, kAllHistory)) std::abort();
  };
  exportAll();
  const auto lines = readLines(folder.file("out"));
  if (lines.size() != static_cast<std::size_t>(state.range(0))) std::abort();
  bench::compare(state, exportAll,
                 [&] { readAndAppend(folder.file("log"), folder.file("floor"), lines); });
}

/// One message of some MiB, of which some bytes are Latin-1, against the same size in ASCII.
void BM_ExportBadlyEncoded(benchmark::State& state) {
  const Folder folder(0);
  const auto writeLog = [&](const char* name, const std::string& letters) {
    std::ofstream log(folder.file(name));
    log << "__REALTIME_TIMESTAMP=1700000000000000\nMESSAGE=";
    for (std::int64_t i = 0; i < state.range(0); ++i) log << letters;
    log << "\n\n";
  };
  writeLog("latin",
           "gr\xFC\xDF"
           "en ");
  writeLog("ascii", "gruess ");
  const auto exportOf = [&](const char* name) {
    host::device().log = folder.file(name);
    if (!OsLogStream::putOsLogStreamToFile(folder.file("out"), {}, {}, kAllHistory)) std::abort();
  };
  const auto latin = [&] { exportOf("latin"); };
  const auto ascii = [&] { exportOf("ascii"); };
  bench::compare(state, latin, ascii);
}

void BM_ExportMemory(benchmark::State& state) {
  const Folder folder(state.range(0));
  for ([[maybe_unused]] auto _ : state) state.counters["peak_MiB"] = peakMemory(folder);
}

#define SIZES Arg(10'000)->Arg(100'000)->Arg(1'000'000)

BENCHMARK(BM_ExportMemory)->SIZES->Iterations(1)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Export)->SIZES->UseManualTime()->Iterations(5)->Unit(benchmark::kMillisecond);

BENCHMARK(BM_ExportBadlyEncoded)
    ->Arg(2'400'000)
    ->UseManualTime()
    ->Iterations(5)
    ->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
