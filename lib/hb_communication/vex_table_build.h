// VEX mode: building the configuration table from the cluster services, and the lists of boot addresses.
//
// Interface lists are of two kinds. What the platform hands out goes back with zu_vex_free_net_intf_info(): the marked
// lists below, and the boot addresses. What hb_copy_net_intf_filter_by_flag() copies goes back with
// hb_free_net_intf_copies(). A start leaves a list of the platform in global_vex_net_intf_tbl, all others leave copies.
#pragma once

#include "hb_global_data/state.h"
#include "zu_evm.h"

// Fills the table from the cluster services; `errno` stays. The notification that caused it, the table whose states are
// carried over, and a list in place of the query may each be null.
Hb_Rc hb_vex_update_global_tbl(Hb_Configuration_Internal* cfg_table, zu_evm_event_metadata_t* event_metadata_p,
                               Hb_Configuration_Internal* src_cfg_table, zu_vex_net_intf_info_t* p_src_intf_tbl);

// Moves global_config_tbl_new into global_config_tbl, whatever it holds: an empty one empties the table in force.
// Without memory (HB_EVEXTBL_COPY) both stay.
void VEX_copy_and_delete_global_config_tbl();

// The same with the table that waits; where none does, the one in force stays. Fails without memory, and it waits on.
Hb_Rc put_waiting_table_in_force();

// Whether anything was built into the table since it was emptied.
bool is_table_built(const Hb_Configuration_Internal& table);

// Sites and the names of networks stay.
void empty_global_config_table(Hb_Configuration_Internal* table);

// The same without releasing anything: what the table owned is another's.
void forget_contents(Hb_Configuration_Internal& table);

// Traces the table.
void hb_vex_dump_global_table(Hb_Configuration_Internal* table, const char* name);

// All interfaces; those that are not in the boot list have ZU_VEX_INTF_ALIAS set, and no other. The list is the
// caller's. A failure leaves the output alone, as it does in the next two.
Hb_Rc hb_vex_get_net_intf_info_and_mark_alias(zu_vex_net_intf_info_t** p_list, zu_vex_net_intf_info_t* p_boot_list);

// The same by the boot list in force. Copies of the interfaces without aliases become global_vex_net_intf_tbl; the list
// that was there is not released.
Hb_Rc hb_get_new_net_intf_info(zu_vex_net_intf_info_t** p_list);

// Reads the boot list anew as well. The lists that were there are released.
void hb_refresh_boot_ip_addrs(zu_vex_net_intf_info_t** p_list);

// The two global lists; both operations run under their mutex. Taking them leaves none in force.
struct Hb_Global_Lists {
  zu_vex_net_intf_info_t* boot_addresses;
  zu_vex_net_intf_info_t* interfaces;  // of the platform or copies
};
Hb_Global_Lists hb_take_global_lists();
void hb_release_global_lists(Hb_Global_Lists lists);

// Whether the list has the interface. Node -1 is any node; a name alone is enough, and so is an address alone.
Hb_Boolean hb_check_if_in_netf_list_by_ipaddr_or_intf(zu_vex_net_intf_info_t* p_list, int node_number,
                                                      const char* p_name, zu_vex_IP_address6_t* p_address);
Hb_Boolean hb_check_if_in_global_boot_ip_list(int node_number, const char* p_name, zu_vex_IP_address6_t* p_address);

// Copies, in reverse order, the entries that have one of the flags, or those that have none of them. Flags 0 is all.
// Without memory the output is null, and copies that were made by then are not released.
Hb_Rc hb_copy_net_intf_filter_by_flag(zu_vex_net_intf_info_t** p_dest, zu_vex_net_intf_info_t* p_src, uint64_t flags,
                                      Hb_Boolean negate);
void hb_free_net_intf_copies(zu_vex_net_intf_info_t* list);

// 1 when they are the same, else 0; an IPv4-mapped address is never the same as a native one.
int same_ip_address(const zu_vex_IP_address6_t* first, const zu_vex_IP_address6_t* second);
