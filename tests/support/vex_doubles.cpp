// The doubles of zu_vex.h and zu_evm.h.
#include <cerrno>

#include "platform_doubles.h"

namespace {

// The next scripted answer, or what the cluster says. `make` yields a new record or list.
template <typename Output, typename Make>
int answer(Vex_Query<Output>& query, Output** output, Make make) {
  ++query.calls;
  Vex_Answer<Output> answer = {scripted_cluster().has_services ? 0 : -1, nullptr, 0, true};
  if (!query.answers.empty()) {
    answer = query.answers.front();
    query.answers.pop_front();
  }
  if (answer.as_usual && !scripted_cluster().has_services) return -1;
  if (answer.result == 0) {
    *output = answer.as_usual ? make() : answer.output;
    Scripted_Cluster::deliver(*output);
  }
  if (answer.error != 0) errno = answer.error;
  return answer.result;
}

zu_vex_node_info_t* nodes() { return scripted_cluster().new_nodes(scripted_cluster().nodes); }
zu_vex_net_intf_info_t* interfaces() { return scripted_cluster().new_interfaces(scripted_cluster().interfaces); }
zu_vex_net_intf_info_t* boot_addresses() {
  return scripted_cluster().new_interfaces(scripted_cluster().boot_addresses);
}

void ask_after(const char* call, const zu_evm_event_metadata_t* event) {
  scripted_cluster().ask(call, event);
  if (scripted_cluster().at_query_after_event) scripted_cluster().at_query_after_event(event);
}

template <typename Record>
int read(const char* call, int descriptor, Platform_Handout wanted, Record** record) {
  void* read_record = *record;
  Platform_Handout kind = wanted;
  const int result = scripted_cluster().read(call, descriptor, {wanted}, &read_record, &kind);
  if (result >= 0) *record = static_cast<Record*>(read_record);
  return result;
}

}  // namespace

int zu_vex_get_cluster_info(zu_vex_cluster_info_t** info) {
  scripted_cluster().ask("zu_vex_get_cluster_info", nullptr);
  return answer(platform_double().cluster_info, info, [] { return scripted_cluster().new_cluster_info(); });
}

int zu_vex_get_node_info(zu_vex_node_info_t** list) {
  scripted_cluster().ask("zu_vex_get_node_info", nullptr);
  return answer(platform_double().node_info, list, nodes);
}

int zu_vex_get_node_info_after_event(const zu_evm_event_metadata_t* event, zu_vex_node_info_t** list) {
  ask_after("zu_vex_get_node_info_after_event", event);
  return answer(platform_double().node_info_after_event, list, nodes);
}

int zu_vex_get_net_intf_info(zu_vex_net_intf_info_t** list) {
  scripted_cluster().ask("zu_vex_get_net_intf_info", nullptr);
  return answer(platform_double().net_intf_info, list, interfaces);
}

int zu_vex_get_net_intf_info_after_event(const zu_evm_event_metadata_t* event, zu_vex_net_intf_info_t** list) {
  ask_after("zu_vex_get_net_intf_info_after_event", event);
  return answer(platform_double().net_intf_info_after_event, list, interfaces);
}

int zu_vex_get_boot_addrs(zu_vex_net_intf_info_t** list) {
  scripted_cluster().ask("zu_vex_get_boot_addrs", nullptr);
  return answer(platform_double().boot_addrs, list, boot_addresses);
}

void zu_vex_free_cluster_info(zu_vex_cluster_info_t* info) {
  Scripted_Cluster::release(info, {Platform_Handout::cluster_info});
}

void zu_vex_free_node_info(zu_vex_node_info_t* list) { Scripted_Cluster::release(list, {Platform_Handout::node_info}); }

void zu_vex_free_net_intf_info(zu_vex_net_intf_info_t* list) {
  Scripted_Cluster::release(list, {Platform_Handout::net_intf_info});
}

int zu_evm_open(const char* path, const char* init_string, int* descriptor) {
  return scripted_cluster().open(path, init_string, descriptor);
}

int zu_evm_read_node_liveness(int descriptor, zu_evm_event_node_or_split_merge_cfg_t* record) {
  void* read_record = nullptr;
  Platform_Handout kind = Platform_Handout::node_liveness;
  const int result =
      scripted_cluster().read("zu_evm_read_node_liveness", descriptor,
                              {Platform_Handout::node_liveness, Platform_Handout::split_merge}, &read_record, &kind);
  if (result < 0) return result;
  record->p_event_node_liveness = static_cast<zu_evm_event_node_liveness_t*>(read_record);
  if (read_record == nullptr) return result;
  return kind == Platform_Handout::split_merge ? ZU_EVM_SPLIT_MERGE_RECORD : ZU_EVM_NODE_LIVENESS_RECORD;
}

int zu_evm_read_split_merge(int descriptor, zu_evm_event_split_merge_cfg_t** record) {
  return read("zu_evm_read_split_merge", descriptor, Platform_Handout::split_merge, record);
}

int zu_evm_read_adapter_liveness(int descriptor, zu_evm_event_adapter_liveness_t** record) {
  return read("zu_evm_read_adapter_liveness", descriptor, Platform_Handout::adapter_liveness, record);
}

int zu_evm_read_ip_change(int descriptor, zu_evm_event_ip_change_t** record) {
  return read("zu_evm_read_ip_change", descriptor, Platform_Handout::ip_change, record);
}

int zu_evm_read_node_list(int descriptor, zu_evm_event_node_list_t** list) {
  return read("zu_evm_read_node_list", descriptor, Platform_Handout::node_list, list);
}

int zu_evm_read_process_liveness(int descriptor, zu_evm_event_process_liveness_t** record) {
  return read("zu_evm_read_process_liveness", descriptor, Platform_Handout::process_liveness, record);
}

int zu_evm_read_cluster_reconfig(int descriptor, zu_evm_event_cluster_reconfig_t** record) {
  return read("zu_evm_read_cluster_reconfig", descriptor, Platform_Handout::cluster_reconfig, record);
}

int zu_evm_read_repository_disk(int descriptor, zu_evm_event_repository_disk_t** record) {
  return read("zu_evm_read_repository_disk", descriptor, Platform_Handout::repository_disk, record);
}

int zu_evm_read_site_cfg(int descriptor, zu_evm_event_site_cfg_t** list) {
  return read("zu_evm_read_site_cfg", descriptor, Platform_Handout::site_cfg, list);
}

void zu_evm_free(void* record) {
  Scripted_Cluster::release(
      record, {Platform_Handout::node_liveness, Platform_Handout::split_merge, Platform_Handout::adapter_liveness,
               Platform_Handout::ip_change, Platform_Handout::node_list, Platform_Handout::process_liveness,
               Platform_Handout::cluster_reconfig, Platform_Handout::repository_disk, Platform_Handout::site_cfg});
}
