#include <cerrno>

#include "VEX_EVMONHandler.h"
#include "VEX_HBC_trace.h"
#include "adapter_list.h"
#include "adapters_by_node.h"
#include "hb_communication/event_reception.h"
#include "platform_list.h"
#include "platform_membership.h"
#include "vex_outputs.h"
#include "vex_platform_records.h"

namespace {

void fill_stable_adapter_group(Hb_Group& group) {
  group.Hb_group_status = Hb_Group_Stable;
  group.Hb_group_type = Hb_Adapter_Group;
  group.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_group_incarnation = HB_NOT_IN_GROUP;
  group.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_group_leader = HB_NO_ADAPTER;
}

void fill_stable_node_group(Hb_Group& group) {
  group.Hb_group_status = Hb_Group_Stable;
  reset_node_membership_group_node_list(&group);
  group.Hb_group_type = Hb_Node_Group;
  group.Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes = 1;
}

void name_node(Hb_Group& group, zu_int32_t node) {
  if (node >= 0 && node < HB_MAX_NODES) {
    group.Hb_membership_grp_union.Hb_node_membership_grp.Hb_node_list[node] = Hb_True;
  }
}

// The whole list, as the configuration may have grown when the event is delivered.
Hb_VEX_Event* new_adapter_event() {
  Hb_VEX_Event* event = VEX_new_event(Hb_Adapter_Group);
  if (event != nullptr) {
    Hb_Adapter_Membership_Grp& membership = event->group.Hb_membership_grp_union.Hb_adapter_membership_grp;
    clear_adapter_list(membership, HB_MAX_ADAPTERS);
    membership.Hb_num_adapters = 0;
    fill_stable_adapter_group(event->group);
  }
  return event;
}

Hb_VEX_Event* new_node_event() {
  Hb_VEX_Event* event = VEX_new_event(Hb_Node_Group);
  if (event != nullptr) {
    fill_stable_node_group(event->group);
  }
  return event;
}

bool is_named(const Hb_VEX_Event* event, Hb_Adapter_Number adapter) {
  return event != nullptr && adapter < HB_MAX_ADAPTERS &&
         event->group.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list[adapter] == VEX_named_in_group;
}

// Names adapters in one event, and counts them.
class Adapter_Event {
 public:
  Adapter_Event(EVMONHandler& handler, Hb_VEX_Event** event, zu_int32_t kind)
      : handler_(handler), event_(event), kind_(kind) {}

  // False when there is no memory for the event, as in the next.
  bool name(Hb_Adapter_Number adapter) {
    handler_.construct_an_adapter_event(event_, kind_, adapter);
    ++count_;
    return event_ == nullptr || *event_ != nullptr;
  }

  bool name_once(Hb_Adapter_Number adapter) {
    return (event_ != nullptr && is_named(*event_, adapter)) || name(adapter);
  }

  zu_int32_t count() const { return count_; }

 private:
  EVMONHandler& handler_;
  Hb_VEX_Event** event_;
  zu_int32_t kind_;
  zu_int32_t count_ = 0;
};

void trace_goes_down(const Hb_Adapter& adapter, zu_int32_t node) {
  trace_data(Trace_Errors, trace_adapter_goes_down,
             {block_of_name(adapter.Hb_adapter_type, sizeof adapter.Hb_adapter_type), block_of(adapter.Hb_adapter_num),
              block_of(adapter.Hb_state), block_of(node)});
}

// An adapter is named in the event and goes down. False when there is no memory for the event.
bool take_down(Hb_Adapter& adapter, zu_int32_t node, Adapter_Event& event) {
  trace_goes_down(adapter, node);
  if (!event.name(adapter.Hb_adapter_num)) {
    return false;
  }
  adapter.Hb_state = Hb_Entity_Down;
  return true;
}

// All of the node that are up; each record of the list counts.
Hb_Rc take_adapters_down(zu_int32_t node, Adapter_Event& event) {
  Hb_Adapter* end = global_config_tbl.Hb_global_adapter_list + adapters_in_list(global_config_tbl);
  for (Hb_Adapter* adapter = global_config_tbl.Hb_global_adapter_list; adapter != end; ++adapter) {
    if (adapter->Hb_state == Hb_Entity_Up && is_adapter_of(global_config_tbl, *adapter, static_cast<uint32_t>(node)) &&
        !take_down(*adapter, node, event)) {
      return fail(HB_ENOMEM);
    }
  }
  return Hb_Success;
}

Hb_Rc take_adapters_down(zu_int32_t node, Adapter_Event& event, const Adapters_By_Node& adapters) {
  const bool whole = adapters.for_each(static_cast<uint32_t>(node), [&](Hb_Adapter& adapter) {
    return adapter.Hb_state != Hb_Entity_Up || take_down(adapter, node, event);
  });
  return whole ? Hb_Success : fail(HB_ENOMEM);
}

void finish(Hb_VEX_Event* event, zu_int32_t kind, zu_int32_t count) {
  if (event != nullptr) {
    event->group.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_num_adapters = count;
  }
  trace_values(Trace_Info, trace_adapters_on_node, kind, count);
}

bool is_up_on(const zu_vex_net_intf_info_t& interface, zu_int32_t node) {
  return interface.node_number == static_cast<uint32_t>(node) && interface.status == ZU_VEX_INTF_STATUS_UP;
}

// The node's interfaces that are up are named in the event, as far as the configuration knows them. One may be listed
// several times.
Hb_Rc name_joining_adapters(zu_int32_t node, Adapter_Event& event, const zu_vex_net_intf_info_t* interfaces) {
  for (const zu_vex_net_intf_info_t& interface : records_of(interfaces)) {
    if (!is_up_on(interface, node)) {
      continue;
    }
    const Hb_Adapter* named = find_adapter_of_interface(table_about_to_take_effect(), interface);
    if (named != nullptr && !event.name_once(named->Hb_adapter_num)) {
      return fail(HB_ENOMEM);
    }
  }
  return Hb_Success;
}

// In the table in force, once all of them are named.
void bring_adapters_up(zu_int32_t node, const zu_vex_net_intf_info_t* interfaces) {
  for (const zu_vex_net_intf_info_t& interface : records_of(interfaces)) {
    Hb_Adapter* present = is_up_on(interface, node) ? find_adapter_of_interface(global_config_tbl, interface) : nullptr;
    if (present != nullptr) {
      present->Hb_state = Hb_Entity_Up;
    }
  }
}

// The interfaces of the cluster, asked for the adapters of a node that joins. An empty list is null, too.
bool query_joining_interfaces(zu_vex_net_intf_info_t*& list) {
  if (evmon_cluster_name == nullptr) {
    trace(Trace_Info, trace_join_without_cluster_name);
  }
  const int result = zu_vex_get_net_intf_info(&list);
  if (result != 0) {
    set_hb_errno(HB_EVEXTBL_INTF);
    trace_values(Trace_Info, trace_join_adapters_failed, result, errno, HB_EVEXTBL_INTF);
  }
  return result == 0;
}

Hb_Rc take_adapters_up(zu_int32_t node, Adapter_Event& event, const zu_vex_net_intf_info_t* interfaces) {
  if (name_joining_adapters(node, event, interfaces) != Hb_Success) {
    return Hb_Failure;
  }
  bring_adapters_up(node, interfaces);
  return Hb_Success;
}

}  // namespace

void EVMONHandler::construct_an_adapter_event(Hb_VEX_Event** _adpt, zu_int32_t _event, Hb_Adapter_Number _adpt_num) {
  if (_adpt == nullptr) {
    return;
  }
  if (*_adpt == nullptr) {
    trace_values(Trace_Errors, trace_new_adapter_event, _event, _adpt_num);
    *_adpt = new_adapter_event();
  }
  if (*_adpt == nullptr) {
    return;
  }
  Hb_Group& group = (*_adpt)->group;
  group.Hb_events = _event;
  if (_adpt_num < HB_MAX_ADAPTERS) {
    group.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list[_adpt_num] = VEX_named_in_group;
  }
  trace_values(Trace_Info, trace_adapter_in_event, _event, _adpt_num);
}

void EVMONHandler::constructNodeEvent(zu_int32_t _node, Hb_VEX_Event** _evt, zu_int32_t _evtType) {
  if (_evt == nullptr) {
    return;
  }
  if (*_evt == nullptr) {
    *_evt = new_node_event();
  }
  if (*_evt != nullptr) {
    (*_evt)->group.Hb_events = _evtType;
    name_node((*_evt)->group, _node);
  }
}

Hb_Rc EVMONHandler::constructAdapterEventOnNode(zu_int32_t _node, Hb_VEX_Event** _evt, zu_int32_t _evtType) {
  Hb_Rc rc = Hb_Success;
  if (_evt != nullptr) {
    *_evt = nullptr;
  }
  Adapter_Event event(*this, _evt, _evtType);
  if (_evtType == HB_EVENT_DEATH) {
    rc = take_adapters_down(_node, event);
  } else if (_evtType == HB_EVENT_JOIN) {
    zu_vex_net_intf_info_t* list = nullptr;
    if (!query_joining_interfaces(list)) {
      return Hb_Failure;
    }
    rc = take_adapters_up(_node, event, Interface_List(list).get());
  }
  finish(_evt != nullptr ? *_evt : nullptr, _evtType, event.count());
  return rc;
}

Hb_Rc construct_adapter_death_on_node(EVMONHandler& handler, zu_int32_t node, Hb_VEX_Event** event,
                                      const Adapters_By_Node& adapters) {
  *event = nullptr;
  Adapter_Event built(handler, event, HB_EVENT_DEATH);
  const Hb_Rc rc = take_adapters_down(node, built, adapters);
  finish(*event, HB_EVENT_DEATH, built.count());
  return rc;
}

void EVMONHandler::constructConfigEvent(Hb_VEX_Event** _evt) {
  if (_evt == nullptr || *_evt != nullptr) {
    return;
  }
  *_evt = VEX_new_configuration_event();
  if (*_evt != nullptr) {
    (*_evt)->sequence_num = hb_vex_next_event_sequence();
  }
}

void EVMONHandler::fillInOneAdapterEvent(Hb_Events* _event, char* _name, Hb_Group* _group, Hb_Seq_Num* _seqnum) {
  if (!put_subscription_name(_event, _name, networkEventSubscriptionName)) {
    trace(Trace_Info, trace_adapter_information_unsubscribed);
  }
  if (_group != nullptr) {
    fill_stable_adapter_group(*_group);
    _group->Hb_events = *_event;
  } else {
    trace(Trace_Errors, trace_adapter_information_without_group);
  }
  *_seqnum = 0;
}

void EVMONHandler::fillInNodeEventInfo(zu_int32_t _node, zu_int32_t _evtType, char* _name, Hb_Group* _group) {
  if (nodeEventSubscriptionName[0] != '\0') {
    put_name(_name, nodeEventSubscriptionName);
  } else {
    put_name(_name, empty_event_name);
    trace(Trace_Errors, trace_node_information_unsubscribed);
  }
  if (_group == nullptr) {
    trace(Trace_Errors, trace_node_information_without_group);
    return;
  }
  fill_stable_node_group(*_group);
  name_node(*_group, _node);
  _group->Hb_events = _evtType;
}

void EVMONHandler::fillInSiteEventInfo(zu_int32_t /*_site*/, zu_int32_t /*_evtType*/, char* /*_name*/,
                                       Hb_Group* /*_group*/) {}
