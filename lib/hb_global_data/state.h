// The process-wide state of the client, and the error number.
#pragma once

#include <pthread.h>

#include "configuration_table.h"
#include "hb_client/error.h"
#include "hb_client/vex.h"
#include "hb_protocol/shared_memory.h"
#include "zu_vex.h"

class EVMONAdapterEventHandler;
class EVMONEventPipeHandler;
class EVMONIPChangeEventHandler;
class EVMONNewGroupEventHandler;
class EVMONNodeListHandler;
class EVMONNodeLivenessHandler;
class EVMONPeerGSLivenessHandler;
class EVMONReconfigEventHandler;
class EVMONSiteConfigEventHandler;
class EVMONSplitMergeEventHandler;
struct VEX_Event;
typedef VEX_Event Hb_VEX_Event;

extern Hb_Boolean client_initialized;
extern int32_t global_hb_errno;

extern Hb_Configuration_Internal global_config_tbl;
extern Hb_Configuration_Internal global_config_tbl_new;  // where VEX mode rebuilds before it compares
// Which nodes are configured, and how many: in daemon mode those that have an adapter, in VEX mode all of the cluster,
// as of the last table that was built.
extern Hb_Boolean global_node_tbl[HB_MAX_NODES];
extern int32_t global_num_nodes;
extern Hb_Boolean global_site_tbl[HB_MAX_SITES];
extern int32_t global_num_sites;
extern Hb_Adapter HB_INVALID_ADAP;  // what an unknown adapter is looked up as; compared by address

extern Hb_memory_configuration_data* data_for_client;
extern Hb_route_sequence* shared_route_info;
extern const Hb_route_sequence* attached_routes;  // the route segment as it was attached, and its entries
extern uint32_t attached_route_count;
extern Hb_security_information* security_info;
extern int shm_id[3];
extern int shm_sem_id;

extern Hb_VEX_Event* event_queue_list;
extern zu_int32_t event_sequence;
extern zu_vex_net_intf_info_t* global_boot_ip_list;
extern zu_vex_net_intf_info_t* global_vex_net_intf_tbl;
extern char* evmon_cluster_name;

extern EVMONAdapterEventHandler* adapter_event_handler_p;
extern EVMONEventPipeHandler* event_pipe_handler_p;
extern EVMONIPChangeEventHandler* ip_change_handler_p;
extern EVMONNewGroupEventHandler* new_group_event_handler_p;
extern EVMONNodeListHandler* node_list_handler_p;
extern EVMONNodeLivenessHandler* node_liveness_handler_p;
extern EVMONPeerGSLivenessHandler* peer_GS_liveness_handler_p;
extern EVMONReconfigEventHandler* cluster_reconfig_handler_p;
extern EVMONSiteConfigEventHandler* site_config_handler_p;
extern EVMONSplitMergeEventHandler* split_merge_handler_p;

extern pthread_mutex_t global_boot_ip_list_mutex;
extern pthread_mutex_t event_queue_list_and_sequence_mutex;
extern pthread_once_t hbapi_global_data_once;

// In VEX mode the name of the last subscription of each kind.
extern Hb_Name nodeEventSubscriptionName;
extern Hb_Name networkEventSubscriptionName;
extern Hb_Name siteEventSubscriptionName;
extern Hb_Name splitMergeEventSubscriptionName;

// The only writer of the error number.
void set_hb_errno(int error);

// Every failure that has a number ends in this.
inline Hb_Rc fail(int error) {
  set_hb_errno(error);
  return Hb_Failure;
}
