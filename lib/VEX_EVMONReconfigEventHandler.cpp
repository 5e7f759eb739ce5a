#include "VEX_EVMONReconfigEventHandler.h"

#include "vex_small_monitors.h"

namespace {

void trace_notification(const zu_evm_event_cluster_reconfig_t& record) {
  trace_data(Trace_Info, trace_reconfig,
             {block_of(record.event_type), block_of(record.node_number), block_of(record.sequence_number),
              block_of(record.reason_number)});
}

}  // namespace

EVMONReconfigEventHandler::EVMONReconfigEventHandler(char* path) : EVMONConfigurationHandler(path, nullptr) {}

Hb_Rc EVMONReconfigEventHandler::handler(Hb_Events* events, char* /*name*/, Hb_Group* /*group*/,
                                         Hb_Seq_Num* /*seqnum_p*/) {
  zu_evm_event_cluster_reconfig_t* record = nullptr;
  const int read_result = zu_evm_read_cluster_reconfig(evmon_fd, &record);
  if (read_result != ZU_EVM_RECORD || record == nullptr) {
    return monitor_cannot_be_read(trace_reconfig_read_failed, read_result, evmon_fd);
  }
  const Monitor_Record<zu_evm_event_cluster_reconfig_t> notification(record);
  trace_notification(*notification);
  return without_event(events);
}
