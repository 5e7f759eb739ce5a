#include <cstring>
#include <memory>
#include <new>

#include "hb_communication/interface_record.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/address_text.h"
#include "platform_list.h"
#include "text_copy.h"
#include "vex_platform_records.h"

namespace {

constexpr int any_node = -1;

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
  copy->p_name = new_copy_of(interface.p_name, interface_name_longest);
  return copy->p_name != nullptr ? copy.release() : nullptr;
}

bool is_kept(const zu_vex_net_intf_info_t& interface, uint64_t flags, Hb_Boolean negate) {
  const bool has_flag = (interface.flags & flags) != 0;
  return flags == 0 || has_flag == (negate == Hb_False);
}

}  // namespace

int same_ip_address(const zu_vex_IP_address6_t* first, const zu_vex_IP_address6_t* second) {
  if (first == nullptr || second == nullptr ||
      is_ipv4_mapped(first->zu_vex_i6_ipv6) != is_ipv4_mapped(second->zu_vex_i6_ipv6)) {
    return 0;
  }
  if (is_ipv4_mapped(first->zu_vex_i6_ipv6)) {
    return first->zu_vex_v4_in_v6.v4_in_v6_ipv4 == second->zu_vex_v4_in_v6.v4_in_v6_ipv4 ? 1 : 0;
  }
  return std::memcmp(first, second, sizeof *first) == 0 ? 1 : 0;
}

Hb_Boolean hb_check_if_in_netf_list_by_ipaddr_or_intf(zu_vex_net_intf_info_t* p_list, int node_number,
                                                      const char* p_name, zu_vex_IP_address6_t* p_address) {
  for (const zu_vex_net_intf_info_t& interface : records_of(p_list)) {
    if (is_interface(interface, node_number, p_name, p_address)) {
      return Hb_True;
    }
  }
  return Hb_False;
}

Hb_Rc hb_copy_net_intf_filter_by_flag(zu_vex_net_intf_info_t** p_dest, zu_vex_net_intf_info_t* p_src, uint64_t flags,
                                      Hb_Boolean negate) {
  zu_vex_net_intf_info_t* head = nullptr;
  for (const zu_vex_net_intf_info_t& interface : records_of(p_src)) {
    if (!is_kept(interface, flags, negate)) {
      continue;
    }
    zu_vex_net_intf_info_t* copy = copy_of(interface);
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
