#include <netinet/in.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <new>
#include <utility>

#include "VEX_HBC_trace.h"
#include "chain_index.h"
#include "hb_client/vex.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/address_text.h"
#include "hb_global_data/mutex_section.h"
#include "vex_platform_records.h"

namespace {

constexpr int any_node = -1;

bool is_ipv4_mapped(const zu_vex_IP_address6_t& address) {
  const uint32_t(&filler)[3] = address.zu_vex_v4_in_v6.filler;
  return filler[0] == 0 && filler[1] == 0 && filler[2] == htonl(0xFFFF);
}

const char* name_of(const zu_vex_net_intf_info_t& interface) {
  return interface.p_name != nullptr ? interface.p_name : "";
}

bool has_name(const zu_vex_net_intf_info_t& interface, const char* p_name) {
  return std::strncmp(name_of(interface), p_name, interface_name_length) == 0;
}

bool is_interface(const zu_vex_net_intf_info_t& interface, int node_number, const char* p_name,
                  const zu_vex_IP_address6_t* p_address) {
  if (node_number != any_node && static_cast<uint32_t>(node_number) != interface.node_number) {
    return false;
  }
  if (p_name != nullptr && !has_name(interface, p_name)) {
    return false;
  }
  return p_address != nullptr ? same_ip_address(&interface.ip_addr, p_address) == 1 : p_name != nullptr;
}

// A copy with a name of its own, or null.
zu_vex_net_intf_info_t* copy_of(const zu_vex_net_intf_info_t& interface) {
  std::unique_ptr<zu_vex_net_intf_info_t> copy(new (std::nothrow) zu_vex_net_intf_info_t(interface));
  if (copy == nullptr || interface.p_name == nullptr) {
    return copy.release();
  }
  const size_t size = std::strlen(interface.p_name) + 1;
  copy->p_name = new (std::nothrow) char[size];
  if (copy->p_name == nullptr) {
    return nullptr;
  }
  std::memcpy(copy->p_name, interface.p_name, size);
  return copy.release();
}

bool is_kept(const zu_vex_net_intf_info_t& interface, uint64_t flags, Hb_Boolean negate) {
  const bool has_flag = (interface.flags & flags) != 0;
  return flags == 0 || has_flag == (negate == Hb_False);
}

// The boot addresses, so that each of many interfaces is found at once.
class Boot_Addresses {
 public:
  explicit Boot_Addresses(zu_vex_net_intf_info_t* list)
      : list_(list),
        count_(length_of(list)),
        records_(new (std::nothrow) const zu_vex_net_intf_info_t*[count_]),
        index_(count_) {
    uint32_t record = 0;
    for (const auto* each = list; each != nullptr && records_ != nullptr; each = each->p_next) {
      records_[record] = each;
      index_.put(record++, hash_of(*each));
    }
  }

  bool has(zu_vex_net_intf_info_t& interface) const {
    const int node = static_cast<int>(interface.node_number);
    if (records_ == nullptr) {
      return hb_check_if_in_netf_list_by_ipaddr_or_intf(list_, node, name_of(interface), &interface.ip_addr) == Hb_True;
    }
    uint32_t record = index_.first(hash_of(interface));
    while (record != Chain_Index::none &&
           !is_interface(*records_[record], node, name_of(interface), &interface.ip_addr)) {
      record = index_.after(record);
    }
    return record != Chain_Index::none;
  }

 private:
  static uint32_t length_of(const zu_vex_net_intf_info_t* list) {
    uint32_t length = 0;
    for (; list != nullptr; list = list->p_next) {
      ++length;
    }
    return length;
  }
  static uint32_t hash_of(const zu_vex_net_intf_info_t& interface) {
    const uint32_t hash = hash_with(0, interface.node_number);
    return hash_with_address(hash_with_text(hash, name_of(interface), interface_name_length), &interface.ip_addr);
  }

  zu_vex_net_intf_info_t* list_;
  uint32_t count_;
  std::unique_ptr<const zu_vex_net_intf_info_t*[]> records_;
  Chain_Index index_;
};

void trace_alias(zu_vex_net_intf_info_t& interface) {
  if (trace_is_on(Trace_Info)) {
    const Errno_Kept kept;
    char address[INET6_ADDRSTRLEN];
    trace_data(Trace_Info, trace_alias_address, {block_of_text(VEX_ntop(&interface.ip_addr, address))});
  }
}

void mark_aliases(zu_vex_net_intf_info_t* list, zu_vex_net_intf_info_t* p_boot_list) {
  const Boot_Addresses boot_addresses(p_boot_list);
  for (auto* each = list; each != nullptr; each = each->p_next) {
    each->flags &= ~ZU_VEX_INTF_ALIAS;
    if (!boot_addresses.has(*each)) {
      each->flags |= ZU_VEX_INTF_ALIAS;
      trace_alias(*each);
    }
  }
}

// The cluster has to be there; what its record says does not matter.
int ask_whether_cluster_is_there() {
  zu_vex_cluster_info_t* info = nullptr;
  const int result = zu_vex_get_cluster_info(&info);
  if (result == 0) {
    const Errno_Kept kept;
    zu_vex_free_cluster_info(info);
  }
  return result;
}

// A step of one of the two operations on the global lists failed.
void trace_step(const char* operation, const char* step, int result) {
  trace_data(Trace_Errors, trace_boot_list_step_failed,
             {block_of_text(operation), block_of_text(step), block_of(result), block_of(errno)});
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

void release_interface_table() {
  if (global_vex_net_intf_tbl != nullptr && global_vex_net_intf_tbl == copies_in_force) {
    hb_free_net_intf_copies(global_vex_net_intf_tbl);
  } else {
    zu_vex_free_net_intf_info(global_vex_net_intf_tbl);
  }
  global_vex_net_intf_tbl = nullptr;
}

void make_mutex_once() { pthread_once(&hbapi_global_data_once, hbapi_global_data_once_init); }

void replace_global_lists(Interface_List boot_list, Copied_List interfaces) {
  const Errno_Kept kept;
  make_mutex_once();
  HB_MUTEX_SECTION_BEGIN(global_boot_ip_list_mutex)
  zu_vex_free_net_intf_info(std::exchange(global_boot_ip_list, boot_list.release()));
  release_interface_table();
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

int same_ip_address(const zu_vex_IP_address6_t* first, const zu_vex_IP_address6_t* second) {
  if (first == nullptr || second == nullptr || is_ipv4_mapped(*first) != is_ipv4_mapped(*second)) {
    return 0;
  }
  if (is_ipv4_mapped(*first)) {
    return first->zu_vex_v4_in_v6.v4_in_v6_ipv4 == second->zu_vex_v4_in_v6.v4_in_v6_ipv4 ? 1 : 0;
  }
  return std::memcmp(first, second, sizeof *first) == 0 ? 1 : 0;
}

Hb_Boolean hb_check_if_in_netf_list_by_ipaddr_or_intf(zu_vex_net_intf_info_t* p_list, int node_number,
                                                      const char* p_name, zu_vex_IP_address6_t* p_address) {
  for (const auto* each = p_list; each != nullptr; each = each->p_next) {
    if (is_interface(*each, node_number, p_name, p_address)) {
      return Hb_True;
    }
  }
  return Hb_False;
}

Hb_Boolean hb_check_if_in_global_boot_ip_list(int node_number, const char* p_name, zu_vex_IP_address6_t* p_address) {
  make_mutex_once();
  Hb_Boolean found = Hb_False;
  HB_MUTEX_SECTION_BEGIN(global_boot_ip_list_mutex)
  found = hb_check_if_in_netf_list_by_ipaddr_or_intf(global_boot_ip_list, node_number, p_name, p_address);
  HB_MUTEX_SECTION_END(global_boot_ip_list_mutex)
  return found;
}

Hb_Rc hb_copy_net_intf_filter_by_flag(zu_vex_net_intf_info_t** p_dest, zu_vex_net_intf_info_t* p_src, uint64_t flags,
                                      Hb_Boolean negate) {
  zu_vex_net_intf_info_t* head = nullptr;
  for (const auto* each = p_src; each != nullptr; each = each->p_next) {
    if (!is_kept(*each, flags, negate)) {
      continue;
    }
    zu_vex_net_intf_info_t* copy = copy_of(*each);
    if (copy == nullptr) {
      // The copies before it stay allocated, by the interface's definition.
      *p_dest = nullptr;
      return Hb_Failure;
    }
    copy->p_next = head;
    head = copy;
  }
  *p_dest = head;
  return Hb_Success;
}

void hb_free_net_intf_copies(zu_vex_net_intf_info_t* list) {
  while (list != nullptr) {
    zu_vex_net_intf_info_t* next = list->p_next;
    delete[] list->p_name;
    delete list;
    list = next;
  }
}

// The interfaces come first: where there is nothing at all it is they that are missed.
Hb_Rc hb_vex_get_net_intf_info_and_mark_alias(zu_vex_net_intf_info_t** p_list, zu_vex_net_intf_info_t* p_boot_list) {
  zu_vex_net_intf_info_t* list = nullptr;
  int result = zu_vex_get_net_intf_info(&list);
  if (result != 0) {
    trace_values(Trace_Errors, trace_interface_query_failed, result);
    return Hb_Failure;
  }
  Interface_List interfaces(list);
  result = ask_whether_cluster_is_there();
  if (result != 0) {
    trace_values(Trace_Errors, trace_cluster_query_failed, result);
    return Hb_Failure;
  }
  mark_aliases(interfaces.get(), p_boot_list);
  *p_list = interfaces.release();
  return Hb_Success;
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
