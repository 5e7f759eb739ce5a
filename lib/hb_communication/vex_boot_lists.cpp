// The two lists that all threads see: the addresses that nodes start with, and the interfaces that have them.
#include <cerrno>
#include <memory>
#include <utility>

#include "VEX_HBC_trace.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/mutex_section.h"
#include "vex_platform_records.h"

namespace {

// A step of one of the two operations on the global lists failed.
void trace_step(const char* operation, const char* step, int result) {
  const int error = errno;
  trace_data(Trace_Errors, trace_boot_list_step_failed,
             {block_of_text(operation), block_of_text(step), block_of(result), block_of(error)});
}

struct Copied_List_Release {
  void operator()(zu_vex_net_intf_info_t* list) const { hb_free_net_intf_copies(list); }
};
using Copied_List = std::unique_ptr<zu_vex_net_intf_info_t, Copied_List_Release>;

// The interfaces, of which aliases are marked, and copies of those that are none.
struct Interfaces {
  Interface_List marked;
  Copied_List without_aliases;
};

Hb_Rc get_interfaces(Interfaces& interfaces, const char* operation, zu_vex_net_intf_info_t* p_boot_list) {
  zu_vex_net_intf_info_t* list = nullptr;
  Hb_Rc rc = hb_vex_get_net_intf_info_and_mark_alias(&list, p_boot_list);
  if (rc != Hb_Success) {
    trace_step(operation, "hb_vex_get_net_intf_info_and_mark_alias", rc);
    return rc;
  }
  interfaces.marked.reset(list);
  list = nullptr;
  rc = hb_copy_net_intf_filter_by_flag(&list, interfaces.marked.get(), ZU_VEX_INTF_ALIAS, Hb_True);
  if (rc != Hb_Success) {
    trace_step(operation, "hb_copy_net_intf_filter_by_flag", rc);
  }
  interfaces.without_aliases.reset(list);
  return rc;
}

// The copies that are global_vex_net_intf_tbl; a start leaves a list of the platform there.
const zu_vex_net_intf_info_t* copies_in_force = nullptr;

void put_in_force(Copied_List list) {
  copies_in_force = list.get();
  global_vex_net_intf_tbl = list.release();
}

void release_interface_table(zu_vex_net_intf_info_t* table) {
  if (table != nullptr && table == copies_in_force) {
    copies_in_force = nullptr;
    hb_free_net_intf_copies(table);
  } else {
    zu_vex_free_net_intf_info(table);
  }
}

void replace_global_lists(Interface_List boot_list, Copied_List interfaces) {
  const Errno_Kept kept;
  make_mutex_once();
  HB_MUTEX_SECTION_BEGIN(global_boot_ip_list_mutex)
  hb_release_global_lists(hb_take_global_lists());
  global_boot_ip_list = boot_list.release();
  put_in_force(std::move(interfaces));
  HB_MUTEX_SECTION_END(global_boot_ip_list_mutex)
}

void refresh(zu_vex_net_intf_info_t** p_list) {
  static constexpr char operation[] = "hb_refresh_boot_ip_addrs";
  zu_vex_net_intf_info_t* list = nullptr;
  const int result = zu_vex_get_boot_addrs(&list);
  if (result != 0) {
    trace_step(operation, "zu_vex_get_boot_addrs", result);
    return;
  }
  Interface_List boot_list(list);
  Interfaces interfaces;
  if (get_interfaces(interfaces, operation, boot_list.get()) == Hb_Success) {
    replace_global_lists(std::move(boot_list), std::move(interfaces.without_aliases));
    *p_list = interfaces.marked.release();
  }
}

}  // namespace

Hb_Global_Lists hb_take_global_lists() {
  return {std::exchange(global_boot_ip_list, nullptr), std::exchange(global_vex_net_intf_tbl, nullptr)};
}

void hb_release_global_lists(Hb_Global_Lists lists) {
  const Errno_Kept kept;
  zu_vex_free_net_intf_info(lists.boot_addresses);
  release_interface_table(lists.interfaces);
}

Hb_Boolean hb_check_if_in_global_boot_ip_list(int node_number, const char* p_name, zu_vex_IP_address6_t* p_address) {
  make_mutex_once();
  Hb_Boolean found = Hb_False;
  HB_MUTEX_SECTION_BEGIN(global_boot_ip_list_mutex)
  found = hb_check_if_in_netf_list_by_ipaddr_or_intf(global_boot_ip_list, node_number, p_name, p_address);
  HB_MUTEX_SECTION_END(global_boot_ip_list_mutex)
  return found;
}

Hb_Rc hb_get_new_net_intf_info(zu_vex_net_intf_info_t** p_list) {
  make_mutex_once();
  Hb_Rc rc = Hb_Failure;
  HB_MUTEX_SECTION_BEGIN(global_boot_ip_list_mutex)
  Interfaces interfaces;
  rc = get_interfaces(interfaces, "hb_get_new_net_intf_info", global_boot_ip_list);
  if (rc == Hb_Success) {
    // The table that was there stays allocated, by the interface's definition.
    put_in_force(std::move(interfaces.without_aliases));
    *p_list = interfaces.marked.release();
  }
  HB_MUTEX_SECTION_END(global_boot_ip_list_mutex)
  return rc;
}

void hb_refresh_boot_ip_addrs(zu_vex_net_intf_info_t** p_list) {
  trace(Trace_Info, trace_refresh_begins);
  refresh(p_list);
  trace(Trace_Info, trace_refresh_ends);
}
