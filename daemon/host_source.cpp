#include "host_source.h"

#include <spdlog/spdlog.h>

#include "failure.h"

namespace hbd {

HostSource::HostSource(Loop& loop)
    : table_(HostMonitor::read_all()),
      cluster_(table_),
      interfaces_(table_),
      poll_(loop, monitor_.descriptor(), [this](int) { take_changes(); }) {}

void HostSource::start(ChangeSink& sink, const Cluster& /*cluster*/) {
  sink_ = &sink;
  poll_.watch(UV_READABLE);
}

void HostSource::take_changes() {
  try {
    monitor_.take_all(table_);
  } catch (const Failure& failure) {
    spdlog::error("{}", failure.what());
    return;
  }
  for (const Change& change : cluster_.changes_to(table_)) {
    sink_->apply(change);
  }
}

}  // namespace hbd
