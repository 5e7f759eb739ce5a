// Resident memory of hbd, with the cluster that it has built in.
#include "daemon_process.h"
#include "hb_client/events.h"
#include "rows.h"
#include "subscriber.h"

namespace bench {
namespace {

double resident_with(size_t clients) {
  raise_descriptor_limit(clients);
  const DaemonProcess daemon(HB_BENCH_DAEMON);
  const Subscribers subscribers(daemon.socket_path(), clients, HB_EVENT_NEW_GROUP);
  subscribers.await_all();  // each is told the group at once, so the daemon has taken their subscriptions then
  return daemon.resident_bytes();
}

}  // namespace

void add_daemon_memory_rows() {
  add_memory_row("memory/hbd, no client", [] { return resident_with(0); });
  add_memory_row("memory/hbd, 500 clients", [] { return resident_with(500); });
}

}  // namespace bench
