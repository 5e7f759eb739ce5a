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

// Runs the row once; what it throws becomes its error.
void register_row(const std::string& name, const std::function<void(benchmark::State&)>& run) {
  const auto once = [run](benchmark::State& state) {
    for (auto iteration : state) {
      (void)iteration;
      try {
        run(state);
      } catch (const std::exception& error) {
        state.SkipWithError(error.what());
      }
    }
  };
  benchmark::RegisterBenchmark(name.c_str(), once)->UseManualTime()->Unit(benchmark::kMicrosecond)->Iterations(1);
}

}  // namespace

void add_row(const Row& row, const Body& body) {
  register_row(row.name, [row, body](benchmark::State& state) {
    body([&](const Contender& ours, const Contender& floor) {
      hand_over(state, row, measure(ours, floor, row.limits));
    });
  });
}

void add_figures(const std::string& name, const std::string& floor, const std::function<Comparison()>& figures) {
  register_row(name, [=](benchmark::State& state) { hand_over(state, {.name = name, .floor = floor}, figures()); });
}

void add_memory_row(const std::string& name, const std::function<double()>& bytes) {
  register_row(name, [bytes](benchmark::State& state) {
    state.counters["bytes"] = bytes();
    state.SetIterationTime(1e-9);
  });
}

}  // namespace bench
