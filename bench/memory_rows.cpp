// Resident memory of a program that is nothing but a client of the largest cluster.
#include <array>
#include <cstdio>
#include <stdexcept>
#include <thread>

#include "client.h"
#include "rows.h"

namespace bench {
namespace {

constexpr double kilobyte = 1024;

// Kilobytes before the start, with the configuration loaded, and with it loaded anew.
std::array<double, 3> measure_client() {
  const Peer peer(full_size);
  point_library_at(peer.socket_path());
  const Bytes update = framed(configuration(HB_CONFIGURATION_UPDATE, full_size));
  Descriptor end;
  std::jthread daemon([&] {
    end = peer.accept_and_answer();
    write_all(end.get(), update);
  });
  FILE* client = popen(HB_BENCH_RESIDENT_CLIENT, "r");
  if (client == nullptr) throw_errno("popen");
  std::array<double, 3> kilobytes{};
  const int read = std::fscanf(client, "%lf %lf %lf", &kilobytes[0], &kilobytes[1], &kilobytes[2]);
  if (pclose(client) != 0 || read != 3) throw std::runtime_error(HB_BENCH_RESIDENT_CLIENT " failed");
  return kilobytes;
}

}  // namespace

void add_memory_rows() {
  add_memory_row("memory/client before its start", [] { return measure_client()[0] * kilobyte; });
  add_memory_row("memory/client, 98,352 adapters, loaded", [] { return measure_client()[1] * kilobyte; });
  add_memory_row("memory/client, 98,352 adapters, reloaded", [] { return measure_client()[2] * kilobyte; });
}

}  // namespace bench
