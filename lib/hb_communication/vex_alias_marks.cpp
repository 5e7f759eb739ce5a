// All interfaces, of which those that no node starts with are marked as aliases.
#include <netinet/in.h>

#include <memory>
#include <new>

#include "VEX_HBC_trace.h"
#include "chain_index.h"
#include "hb_communication/interface_record.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/address_text.h"
#include "platform_list.h"
#include "vex_platform_records.h"

namespace {

// The boot addresses, so that each of many interfaces is found at once.
class Boot_Addresses {
 public:
  explicit Boot_Addresses(const zu_vex_net_intf_info_t* list)
      : list_(list),
        count_(length_of(list)),
        records_(new (std::nothrow) const zu_vex_net_intf_info_t*[count_]),
        index_(count_) {
    if (records_ != nullptr) {
      uint32_t record = 0;
      for (const zu_vex_net_intf_info_t& address : records_of(list)) {
        records_[record] = &address;
        index_.put(record++, hash_of(address));
      }
    }
  }

  bool has(const zu_vex_net_intf_info_t& interface) const {
    return records_ != nullptr ? is_indexed(interface) : is_listed(interface);
  }

 private:
  // Every number of a node is one here: none stands for any.
  static bool is_same(const zu_vex_net_intf_info_t& address, const zu_vex_net_intf_info_t& interface) {
    return address.node_number == interface.node_number && has_name(address, name_of(interface)) &&
           same_ip_address(&address.ip_addr, &interface.ip_addr) == 1;
  }
  bool is_indexed(const zu_vex_net_intf_info_t& interface) const {
    uint32_t record = index_.first(hash_of(interface));
    while (record != Chain_Index::none && !is_same(*records_[record], interface)) {
      record = index_.after(record);
    }
    return record != Chain_Index::none;
  }
  bool is_listed(const zu_vex_net_intf_info_t& interface) const {
    for (const zu_vex_net_intf_info_t& address : records_of(list_)) {
      if (is_same(address, interface)) {
        return true;
      }
    }
    return false;
  }
  static uint32_t length_of(const zu_vex_net_intf_info_t* list) {
    uint32_t length = 0;
    for ([[maybe_unused]] const zu_vex_net_intf_info_t& address : records_of(list)) {
      ++length;
    }
    return length;
  }
  static uint32_t hash_of(const zu_vex_net_intf_info_t& interface) {
    const uint32_t hash = hash_with(0, interface.node_number);
    return hash_with_address(hash_with_text(hash, name_of(interface), interface_name_length), &interface.ip_addr);
  }

  const zu_vex_net_intf_info_t* list_;
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

void mark_aliases(zu_vex_net_intf_info_t* list, const zu_vex_net_intf_info_t* p_boot_list) {
  const Boot_Addresses boot_addresses(p_boot_list);
  for (zu_vex_net_intf_info_t& interface : records_of(list)) {
    interface.flags &= ~ZU_VEX_INTF_ALIAS;
    if (!boot_addresses.has(interface)) {
      interface.flags |= ZU_VEX_INTF_ALIAS;
      trace_alias(interface);
    }
  }
}

// The cluster has to be there; what its record says does not matter.
int ask_whether_cluster_is_there() {
  zu_vex_cluster_info_t* info = nullptr;
  const int result = zu_vex_get_cluster_info(&info);
  const Cluster_Answer cluster(result == 0 ? info : nullptr);
  return result;
}

}  // namespace

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
