#include "rows.h"

#include <benchmark/benchmark.h>

#include <exception>

namespace bench {
namespace {

void hand_over(benchmark::State& state, const Row& row, const Comparison& result) {
  state.SetIterationTime(result.ours);
  state.SetLabel(row.floor);
  state.counters["ours"] = result.ours;
  state.counters["floor"] = result.floor;
  state.counters["ratio"] = result.ratio;
  state.counters["ratio_low"] = result.ratio_low;
  state.counters["ratio_high"] = result.ratio_high;
  state.counters["limit"] = row.limit;
  state.counters["rounds"] = static_cast<double>(result.rounds);
  state.counters["stable"] = result.stable ? 1 : 0;
}

void run_row(benchmark::State& state, const Row& row, const Body& body) {
  for (auto iteration : state) {
    (void)iteration;
    try {
      body([&](const Contender& ours, const Contender& floor) {
        hand_over(state, row, measure(ours, floor, row.limits));
      });
    } catch (const std::exception& error) {
      state.SkipWithError(error.what());
    }
  }
}

void run_memory_row(benchmark::State& state, const std::function<double()>& bytes) {
  for (auto iteration : state) {
    (void)iteration;
    try {
      state.counters["bytes"] = bytes();
      state.SetIterationTime(1e-9);
    } catch (const std::exception& error) {
      state.SkipWithError(error.what());
    }
  }
}

}  // namespace

void add_row(const Row& row, const Body& body) {
  benchmark::RegisterBenchmark(row.name.c_str(), [row, body](benchmark::State& state) { run_row(state, row, body); })
      ->UseManualTime()
      ->Unit(benchmark::kMicrosecond)
      ->Iterations(1);
}

void add_memory_row(const std::string& name, const std::function<double()>& bytes) {
  benchmark::RegisterBenchmark(name.c_str(), [bytes](benchmark::State& state) { run_memory_row(state, bytes); })
      ->UseManualTime()
      ->Iterations(1);
}

}  // namespace bench
