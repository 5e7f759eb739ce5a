#include "hb_global_data/vex_handler_set.h"

#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_EVMONNewGroupEventHandler.h"
#include "hb_global_data/state.h"

char* evmon_cluster_name = nullptr;

EVMONAdapterEventHandler* adapter_event_handler_p = nullptr;
EVMONEventPipeHandler* event_pipe_handler_p = nullptr;
EVMONIPChangeEventHandler* ip_change_handler_p = nullptr;
EVMONNewGroupEventHandler* new_group_event_handler_p = nullptr;
EVMONNodeListHandler* node_list_handler_p = nullptr;
EVMONNodeLivenessHandler* node_liveness_handler_p = nullptr;
EVMONPeerGSLivenessHandler* peer_GS_liveness_handler_p = nullptr;
EVMONReconfigEventHandler* cluster_reconfig_handler_p = nullptr;
EVMONSiteConfigEventHandler* site_config_handler_p = nullptr;
EVMONSplitMergeEventHandler* split_merge_handler_p = nullptr;

// Where the monitors are absent only the two pipe handlers can exist.
void VEX_delete_global_event_handlers() {
  delete[] evmon_cluster_name;
  evmon_cluster_name = nullptr;
  delete new_group_event_handler_p;
  new_group_event_handler_p = nullptr;
  delete event_pipe_handler_p;
  event_pipe_handler_p = nullptr;
}
