// The interfaces of one node, as the cluster services have them once what a notification tells of has happened. They
// are asked when it first matters: the answer is the whole cluster's.
#pragma once

#include <cstring>

#include "VEX_interface_changes.h"
#include "platform_list.h"

class Present_Interfaces {
 public:
  Present_Interfaces(uint32_t node, zu_evm_event_metadata_t metadata) : node_(node), metadata_(metadata) {}

  // Whether the services have the adapter's interface in the other state. They do not when they do not answer, do not
  // list it, or do not know its state.
  bool contradict(const Hb_Adapter& adapter, Hb_Entity_State state) {
    ask_once();
    const zu_vex_net_intf_info_t* found = find(adapter);
    return found != nullptr &&
           found->status == (state == Hb_Entity_Up ? ZU_VEX_INTF_STATUS_DOWN : ZU_VEX_INTF_STATUS_UP);
  }

 private:
  void ask_once() {
    if (is_asked_) {
      return;
    }
    is_asked_ = true;
    const Errno_Kept kept;
    zu_vex_net_intf_info_t* list = nullptr;
    if (zu_vex_get_net_intf_info_after_event(&metadata_, &list) == 0) {
      list_.reset(list);
    }
  }

  const zu_vex_net_intf_info_t* find(const Hb_Adapter& adapter) const {
    const zu_vex_net_intf_info_t* first = list_.get();
    for (const zu_vex_net_intf_info_t& each : records_of(first)) {
      if (each.node_number == node_ && is_adapter_on(adapter, each.p_name) &&
          std::memcmp(&adapter.Hb_ip_address, &each.ip_addr, sizeof each.ip_addr) == 0) {
        return &each;
      }
    }
    return nullptr;
  }

  uint32_t node_;
  zu_evm_event_metadata_t metadata_;
  bool is_asked_ = false;
  Interface_List list_;
};
