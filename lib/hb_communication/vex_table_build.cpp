#include "hb_communication/vex_table_build.h"

#include <cerrno>

#include "VEX_HBC_trace.h"

namespace {
constexpr int absent = -1;  // what every query of the cluster services yields here
}

Hb_Rc hb_vex_update_global_tbl(Hb_Configuration_Internal* /*cfg_table*/, zu_evm_event_metadata_t* /*event_metadata_p*/,
                               Hb_Configuration_Internal* /*src_cfg_table*/,
                               zu_vex_net_intf_info_t* /*p_src_intf_tbl*/) {
  static constexpr char call[] = "zu_vex_get_cluster_info()";
  static constexpr char variant[] = "(Default)";
  const int result = absent;
  const int error = errno;
  set_hb_errno(HB_EVEXTBL_BUILD);
  trace_data(Trace_Errors, trace_table_query_failed, {call, sizeof call}, {variant, sizeof variant},
             {&result, sizeof result}, {&error, sizeof error});
  return Hb_Failure;
}

Hb_Rc hb_vex_get_net_intf_info_and_mark_alias(zu_vex_net_intf_info_t** /*p_list*/,
                                              zu_vex_net_intf_info_t* /*p_boot_list*/) {
  trace_values(Trace_Errors, trace_interface_query_failed, absent);
  return Hb_Failure;
}

Hb_Rc hb_copy_net_intf_filter_by_flag(zu_vex_net_intf_info_t** p_dest, zu_vex_net_intf_info_t* /*p_src*/,
                                      uint64_t /*flags*/, Hb_Boolean /*negate*/) {
  *p_dest = nullptr;  // without cluster services there is no interface to copy
  return Hb_Success;
}
