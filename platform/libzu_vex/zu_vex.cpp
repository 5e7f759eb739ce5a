// A platform without cluster services: every query yields -1.
#include "zu_vex.h"

namespace {
constexpr int absent = -1;
}

int zu_vex_get_cluster_info(zu_vex_cluster_info_t** /*info*/) { return absent; }
int zu_vex_get_node_info(zu_vex_node_info_t** /*list*/) { return absent; }
int zu_vex_get_node_info_after_event(const zu_evm_event_metadata_t* /*event*/, zu_vex_node_info_t** /*list*/) {
  return absent;
}
int zu_vex_get_net_intf_info(zu_vex_net_intf_info_t** /*list*/) { return absent; }
int zu_vex_get_net_intf_info_after_event(const zu_evm_event_metadata_t* /*event*/, zu_vex_net_intf_info_t** /*list*/) {
  return absent;
}
int zu_vex_get_boot_addrs(zu_vex_net_intf_info_t** /*list*/) { return absent; }

// Nothing is ever handed out.
void zu_vex_free_cluster_info(zu_vex_cluster_info_t* /*info*/) {}
void zu_vex_free_node_info(zu_vex_node_info_t* /*list*/) {}
void zu_vex_free_net_intf_info(zu_vex_net_intf_info_t* /*list*/) {}
