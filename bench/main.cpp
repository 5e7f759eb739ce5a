// The benchmarks: Google Benchmark's command line, everything on one processor.
#include <benchmark/benchmark.h>
#include <sched.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>

#include "rows.h"
#include "segments.h"

namespace {

// The last processor that this process may use, or the one that HB_BENCH_CPU names.
int chosen_processor() {
  if (const char* named = std::getenv("HB_BENCH_CPU")) return std::atoi(named);
  cpu_set_t allowed;
  if (sched_getaffinity(0, sizeof allowed, &allowed) != 0) return 0;
  for (int processor = CPU_SETSIZE - 1; processor > 0; --processor) {
    if (CPU_ISSET(processor, &allowed)) return processor;
  }
  return 0;
}

bool pin_to(int processor) {
  cpu_set_t one;
  CPU_ZERO(&one);
  CPU_SET(processor, &one);
  return sched_setaffinity(0, sizeof one, &one) == 0;
}

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;
  std::signal(SIGPIPE, SIG_IGN);
  bench::clear_up_on_signals();
  const int processor = chosen_processor();
  if (!pin_to(processor)) {
    std::fprintf(stderr, "hb_bench: cannot run on processor %d; name another one in HB_BENCH_CPU\n", processor);
    return 2;
  }
  benchmark::AddCustomContext("processor", std::to_string(processor));
  bench::add_event_rows();
  bench::add_turn_rows();
  bench::add_configuration_rows();
  bench::add_look_up_rows();
  bench::add_walk_rows();
  bench::add_request_rows();
  bench::add_steering_rows();
  bench::add_route_rows();
  bench::add_notification_rows();
  bench::add_vex_rows();
  bench::add_memory_rows();
#ifdef HB_BENCH_DAEMON
  bench::add_daemon_rows();
  bench::add_daemon_memory_rows();
#endif
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
