#include "VEX_EVMONRepositoryDiskHandler.h"

#include "vex_small_monitors.h"

namespace {

void trace_notification(const zu_evm_event_repository_disk_t& record) {
  trace_data(Trace_Info, trace_repository_disk,
             {block_of(record.event_type), block_of(record.node_number), block_of(record.sequence_number),
              block_of(record.reason_number), block_of_name(record.disk_name, longest_name)});
}

}  // namespace

EVMONRepositoryDiskHandler::EVMONRepositoryDiskHandler(char* path) : EVMONHandler(path, nullptr) {}

Hb_Rc EVMONRepositoryDiskHandler::handler(Hb_Events* events, char* /*name*/, Hb_Group* /*group*/,
                                          Hb_Seq_Num* /*seqnum_p*/) {
  zu_evm_event_repository_disk_t* record = nullptr;
  const int read_result = zu_evm_read_repository_disk(evmon_fd, &record);
  if (read_result != ZU_EVM_RECORD || record == nullptr) {
    return monitor_cannot_be_read(trace_repository_disk_read_failed, read_result, evmon_fd);
  }
  const Monitor_Record<zu_evm_event_repository_disk_t> notification(record);
  trace_notification(*notification);
  return without_event(events);
}
