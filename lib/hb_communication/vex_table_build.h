// VEX mode: building the configuration table from the cluster services. On this platform they are absent.
#pragma once

#include "hb_global_data/state.h"

struct zu_evm_event_metadata_t;

Hb_Rc hb_vex_update_global_tbl(Hb_Configuration_Internal* cfg_table, zu_evm_event_metadata_t* event_metadata_p,
                               Hb_Configuration_Internal* src_cfg_table, zu_vex_net_intf_info_t* p_src_intf_tbl);

Hb_Rc hb_vex_get_net_intf_info_and_mark_alias(zu_vex_net_intf_info_t** p_list, zu_vex_net_intf_info_t* p_boot_list);

Hb_Rc hb_copy_net_intf_filter_by_flag(zu_vex_net_intf_info_t** p_dest, zu_vex_net_intf_info_t* p_src, uint64_t flags,
                                      Hb_Boolean negate);
