#pragma once

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <vector>

/// Times work against its floor, the least that any program would have to do for it.
namespace bench {

template <class Work>
double secondsOf(Work&& work) {
  const auto start = std::chrono::steady_clock::now();
  work();
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

inline double median(std::vector<double> values) {
  std::ranges::sort(values);
  return values[values.size() / 2];
}

/// Runs `work` and `floor` in turn, so that both see the same machine. The time reported is the
/// work's; the counters are the floor's median in seconds and the median of the ratios pair by
/// pair. For benchmarks registered with UseManualTime.
template <class Work, class Floor>
void compare(benchmark::State& state, Work&& work, Floor&& floor) {
  std::vector<double> floors;
  std::vector<double> ratios;
  for ([[maybe_unused]] auto _ : state) {
    const double seconds = secondsOf(work);
    floors.push_back(secondsOf(floor));
    ratios.push_back(seconds / floors.back());
    state.SetIterationTime(seconds);
  }
  state.counters["floor_s"] = median(floors);
  state.counters["ratio"] = median(ratios);
}

}  // namespace bench
