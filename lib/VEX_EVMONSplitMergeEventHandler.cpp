#include "VEX_EVMONSplitMergeEventHandler.h"

#include <cerrno>

#include "vex_platform_records.h"

namespace {

Hb_Rc nothing_to_read(Hb_Events* events) {
  trace(Trace_Info, trace_split_merge_nothing);
  *events = HB_EVENT_NONE;
  return Hb_Success;
}

}  // namespace

EVMONSplitMergeEventHandler::EVMONSplitMergeEventHandler(char* path) : EVMONConfigurationHandler(path, nullptr) {}

Hb_Rc EVMONSplitMergeEventHandler::handler(Hb_Events* events, char* /*name*/, Hb_Group* /*group*/,
                                           Hb_Seq_Num* /*seqnum_p*/) {
  trace_values(Trace_Info, trace_split_merge_begins, evmon_fd);
  zu_evm_event_split_merge_cfg_t* record = nullptr;
  const int read_result = zu_evm_read_split_merge(evmon_fd, &record);
  const Monitor_Record<zu_evm_event_split_merge_cfg_t> owner(record);
  const Hb_Rc rc = read_result == ZU_EVM_NOTHING
                       ? nothing_to_read(events)
                       : cannot_be_read(trace_split_merge_read_failed, read_result, evmon_fd, errno);
  trace_values(Trace_Info, trace_split_merge_ends, evmon_fd);
  return rc;
}
