#include "VEX_EVMONSiteConfigEventHandler.h"

#include "vex_small_monitors.h"

namespace {

void trace_notification(const zu_evm_event_site_cfg_t& record) {
  trace_data(Trace_Info, trace_site_config,
             {block_of(record.event_type), block_of(record.node_number), block_of(record.site_number),
              block_of(record.sequence_number), block_of(record.reason_number),
              block_of_name(record.site_name, longest_name)});
}

bool is_of_local_node(const zu_evm_event_site_cfg_t& record) {
  return static_cast<int64_t>(record.node_number) == global_config_tbl.local_node_number;
}

}  // namespace

EVMONSiteConfigEventHandler::EVMONSiteConfigEventHandler(char* path)
    : EVMONConfigurationHandler(path, nullptr),
      cached_local_node_uuid{},
      cached_local_node_uuid_obtained(false),
      cached_local_site_info{},
      cached_local_site_info_obtained(false),
      cached_site_merge_policy{},
      cached_site_merge_policy_obtained(false) {}

Hb_Rc EVMONSiteConfigEventHandler::handler(Hb_Events* events, char* /*name*/, Hb_Group* /*group*/,
                                           Hb_Seq_Num* /*seqnum_p*/) {
  trace_values(Trace_Info, trace_site_config_begins, evmon_fd);
  const Hb_Rc rc = read_and_learn(events);
  trace_values(Trace_Info, trace_site_config_ends, evmon_fd);
  return rc;
}

Hb_Rc EVMONSiteConfigEventHandler::read_and_learn(Hb_Events* events) {
  zu_evm_event_site_cfg_t* record = nullptr;
  const int read_result = zu_evm_read_site_cfg(evmon_fd, &record);
  if (read_result == ZU_EVM_NOTHING) {
    trace(Trace_Info, trace_site_config_nothing);
    return without_event(events);
  }
  if (read_result != ZU_EVM_RECORD || record == nullptr) {
    return monitor_cannot_be_read(trace_site_config_read_failed, read_result, evmon_fd);
  }
  const Monitor_Record<zu_evm_event_site_cfg_t> list(record);
  for_each_notification(list.get(), [this](const zu_evm_event_site_cfg_t& each) {
    trace_notification(each);
    learn(each);
  });
  return without_event(events);
}

void EVMONSiteConfigEventHandler::learn(const zu_evm_event_site_cfg_t& record) {
  if (!is_of_local_node(record)) {
    return;
  }
  cached_local_node_uuid = record.node_id;
  cached_local_node_uuid_obtained = true;
  learn_site(record);
}

void EVMONSiteConfigEventHandler::learn_site(const zu_evm_event_site_cfg_t& record) {
  const bool is_there = record.event_type != ZU_EVM_SITE_DELETE;
  cached_local_site_info_obtained = is_there;
  cached_site_merge_policy_obtained = is_there;
  if (is_there) {
    cached_local_site_info = {record.site_id, record.site_number, record.site_priority};
    cached_site_merge_policy = record.site_policy;
  }
}
