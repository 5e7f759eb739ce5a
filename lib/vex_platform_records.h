// What the platform hands out, given back with its owner.
#pragma once

#include <memory>

#include "VEX_HBC_trace.h"
#include "hb_client/types.h"
#include "zu_evm.h"

struct Monitor_Record_Release {
  void operator()(void* record) const {
    const Errno_Kept kept;
    zu_evm_free(record);
  }
};

// A record of a monitor, or a list of them.
template <typename Record>
using Monitor_Record = std::unique_ptr<Record, Monitor_Record_Release>;

struct Platform_Answer_Release {
  void operator()(zu_vex_net_intf_info_t* list) const {
    const Errno_Kept kept;
    zu_vex_free_net_intf_info(list);
  }
  void operator()(zu_vex_node_info_t* list) const {
    const Errno_Kept kept;
    zu_vex_free_node_info(list);
  }
  void operator()(zu_vex_cluster_info_t* info) const {
    const Errno_Kept kept;
    zu_vex_free_cluster_info(info);
  }
};

// What a query of the cluster services answered.
using Interface_List = std::unique_ptr<zu_vex_net_intf_info_t, Platform_Answer_Release>;
using Node_List = std::unique_ptr<zu_vex_node_info_t, Platform_Answer_Release>;
using Cluster_Answer = std::unique_ptr<zu_vex_cluster_info_t, Platform_Answer_Release>;

// Of an interface's name the first characters are compared, as many as the type of an adapter has room for get into a
// table, and a copy has it whole. Behind the longest name nothing is read, whether or not it has ended by then.
enum {
  interface_name_length = 32,
  interface_name_in_table = sizeof(Hb_Adapter_Type) - 1,
  interface_name_longest = 255
};

// A monitor whose record cannot be read: an error. The values come in the order that the trace record has.
template <typename... Values>
Hb_Rc cannot_be_read(Trace_Record record, Values... values) {
  trace_values(Trace_Errors, record, values...);
  return Hb_Failure;
}

inline Trace_Block block_of_interface(const char* name) { return block_of_name(name, interface_name_length); }
