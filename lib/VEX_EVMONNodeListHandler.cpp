#include "VEX_EVMONNodeListHandler.h"

#include "vex_small_monitors.h"

namespace {

void trace_notification(const zu_evm_event_node_list_t& record) {
  trace_data(Trace_Info, trace_node_list,
             {block_of(record.event_type), block_of(record.node_number), block_of(record.sequence_number),
              block_of(record.reason_number), block_of_name(record.node_name, longest_name)});
}

}  // namespace

EVMONNodeListHandler::EVMONNodeListHandler(char* path) : EVMONConfigurationHandler(path, nullptr) {}

Hb_Rc EVMONNodeListHandler::handler(Hb_Events* events, char* /*name*/, Hb_Group* /*group*/, Hb_Seq_Num* /*seqnum_p*/) {
  trace_values(Trace_Info, trace_node_list_begins, evmon_fd);
  const Hb_Rc rc = read_and_trace(events);
  trace_values(Trace_Info, trace_node_list_ends, evmon_fd);
  return rc;
}

Hb_Rc EVMONNodeListHandler::read_and_trace(Hb_Events* events) {
  zu_evm_event_node_list_t* record = nullptr;
  const int read_result = zu_evm_read_node_list(evmon_fd, &record);
  if (read_result != ZU_EVM_RECORD || record == nullptr) {
    return monitor_cannot_be_read(trace_node_list_read_failed, read_result, evmon_fd);
  }
  const Monitor_Record<zu_evm_event_node_list_t> list(record);
  for_each_notification(list.get(), trace_notification);
  return without_event(events);
}
