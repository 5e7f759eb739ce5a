// What the cluster services are asked for before a configuration table is built.
#pragma once

#include "vex_platform_records.h"

// What the services answered, given back when the table is built.
struct Table_Answers {
  Cluster_Answer cluster;
  Node_List nodes;
  Interface_List own_interfaces;                       // empty when the caller brought a list
  const zu_vex_net_intf_info_t* interfaces = nullptr;  // that list, or the caller's
  Trace_Block interface_source = {};                   // where it came from
};

// Asks for the cluster, its nodes and its interfaces; the list of interfaces, when there is one, stands for their
// query. `saved_errno` is what is traced when the cluster is not there.
Hb_Rc ask_cluster_services(Table_Answers& answers, const zu_evm_event_metadata_t* event,
                           const zu_vex_net_intf_info_t* interfaces, int saved_errno);

// A call that the table needs has failed.
Hb_Rc fail_table_build(Trace_Block call, int result, int system_error, int library_error);
