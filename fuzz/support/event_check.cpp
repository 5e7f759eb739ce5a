#include "support/event_check.h"

#include <array>

#include "hb_communication/event_reception.h"
#include "hb_global_data/node_table.h"
#include "support/conventions.h"
#include "support/system.h"

namespace fuzz {

namespace {

constexpr int32_t adapter_death = 2;
constexpr int32_t adapter_new_group = 4;
constexpr int32_t node_death = 5;
constexpr int32_t node_new_group = 7;
constexpr int32_t configuration_update = 9;
constexpr int32_t failure_data = 12;
constexpr int32_t different_instance = 13;
constexpr int32_t heartbeat = 15;

// Where the fields of a packet stand.
constexpr size_t leader_at = 4;
constexpr size_t group_incarnation_at = 16;
constexpr size_t status_at = 20;
constexpr size_t name_at = 24;
constexpr size_t ffdc_at = 60;
constexpr size_t sequence_at = 104;

constexpr size_t group_header_size = 60;
constexpr auto unknown = static_cast<Hb_Entity_State>(-1);
constexpr auto stale_sequence = 4711U;
constexpr Hb_Events stale_events = 4711;

bool is_between(int32_t kind, int32_t first, int32_t last) { return kind >= first && kind <= last; }

// Adapters and nodes have the same three events, in the same order.
Hb_Events membership_event(int32_t order) {
  switch (order) {
    case 0:
      return 1;
    case 1:
      return 2;
    default:
      return 4;
  }
}

bool holds_adapters(Bytes message) {
  const int64_t last_index = field<int32_t>(message, 0);
  return message.size() >= 4 && (last_index < 0 || 4 + 8 * (last_index + 1) <= static_cast<int64_t>(message.size()));
}

Hb_Adapter_Membership_Grp& adapters_of(Hb_Group& group) {
  return group.Hb_membership_grp_union.Hb_adapter_membership_grp;
}

Hb_Node_Membership_Grp& nodes_of(Hb_Group& group) { return group.Hb_membership_grp_union.Hb_node_membership_grp; }

}  // namespace

Event_Check::Event_Check() : nodes_(HB_MAX_NODES) {
  beyond_limit_.reserve(4096);
  changed_adapters_.reserve(4096);
}

Hb_Rc Event_Check::take(Bytes packet, bool wait_without_limit) {
  expected_outputs_ = {stale_events, "stale", stale_sequence};
  actual_outputs_ = expected_outputs_;
  expected_.Hb_cursor = actual_.Hb_cursor;  // walks have moved it; an event does not
  touch(group_header_size);
  const int error = error_of(packet);
  receive(packet, error, wait_without_limit);
  const int32_t kind = field<int32_t>(packet, 0);
  const bool is_event = is_between(kind, adapter_death, node_new_group) || kind == configuration_update ||
                        kind == failure_data || kind == different_instance || kind == heartbeat;
  if (error == no_error || !is_event) {
    std::memset(expected_.Hb_ffdc_id, 0, sizeof expected_.Hb_ffdc_id);
    expected_outputs_.sequence = field<uint32_t>(packet, sequence_at);
  }
  if (error == no_error) {
    apply(packet);
  }
  compare();
  compare_tables();
  return error == no_error ? Hb_Success : Hb_Failure;
}

int Event_Check::error_of(Bytes packet) const {
  const int32_t kind = field<int32_t>(packet, 0);
  const Bytes message = message_of(packet);
  bool good = false;
  if (is_between(kind, adapter_death, adapter_new_group)) {
    good = holds_adapters(message);
  } else if (is_between(kind, node_death, node_new_group)) {
    good = message.size() >= 4 * static_cast<size_t>(model_.header().max_nodes);
  } else if (kind == configuration_update) {
    good = Configuration_Model::is_usable(message);
  } else if (kind == different_instance) {
    good = message.size() >= 20;
  } else if (kind == heartbeat) {
    good = message.size() >= 16;
  } else {
    good = kind == failure_data;
  }
  return good ? no_error : int{HB_EBADREPLY};
}

void Event_Check::receive(Bytes packet, int error, bool wait_without_limit) {
  static Buffer frame;
  const auto length = static_cast<int32_t>(packet.size());
  frame.resize(sizeof length + packet.size());
  std::memcpy(frame.data(), &length, sizeof length);
  if (!packet.empty()) {
    std::memcpy(frame.data() + sizeof length, packet.data(), packet.size());
  }
  the_system.stream = frame;
  int descriptors[] = {descriptor, -1};
  timeval timeout = {1, 0};
  expect(error, [&] {
    return hb_get_event_message(descriptors, wait_without_limit ? nullptr : &timeout, &actual_outputs_.events,
                                actual_outputs_.name, &actual_, &actual_outputs_.sequence);
  });
  REQUIRE(the_system.stream.empty());
}

void Event_Check::apply(Bytes packet) {
  const int32_t kind = field<int32_t>(packet, 0);
  if (is_between(kind, adapter_death, adapter_new_group)) {
    return apply_adapter_event(packet);
  }
  switch (kind) {
    case configuration_update:
      return apply_configuration(packet);
    case failure_data:
      expect_failure_data(packet);
      set_event(8);
      return set_name("Hb_FFDC_Group");
    case different_instance: {
      const auto sender = field<Hb_Diff_Instance_Info>(message_of(packet), 0);
      std::memcpy(&expected_.Hb_membership_grp_union, &sender, sizeof sender);
      touch(group_header_size + sizeof sender);
      expected_.Hb_group_type = Hb_Diff_Instance_Type;
      set_event(256);
      return set_subscription_name(packet);
    }
    case heartbeat:
      return apply_heartbeat(packet);
    default:
      return apply_node_event(packet);
  }
}

void Event_Check::apply_adapter_event(Bytes packet) {
  const int32_t kind = field<int32_t>(packet, 0);
  const Bytes message = message_of(packet);
  const int32_t last_index = field<int32_t>(message, 0);
  Hb_Adapter_Membership_Grp& members = adapters_of(expected_);
  const uint32_t limit = model_.adapter_limit();
  touch(group_header_size + offsetof(Hb_Adapter_Membership_Grp, Hb_adapter_list) + 4 * size_t{limit});
  std::memset(members.Hb_adapter_list, 0xFF, 4 * size_t{limit});
  for (int64_t i = 0; i <= last_index; ++i) {
    const auto entry = field<hb_adapter_event_entry>(message, 4 + 8 * static_cast<size_t>(i));
    if (entry.adapter >= HB_MAX_ADAPTERS) {
      continue;
    }
    members.Hb_adapter_list[entry.adapter] = entry.incarnation;
    if (entry.adapter >= limit) {
      beyond_limit_.push_back(entry.adapter);
    }
    changed_adapters_.push_back(entry.adapter);
    if (Hb_Adapter* adapter = model_.find(entry.adapter)) {
      adapter->Hb_state = kind == adapter_death ? Hb_Entity_Down : Hb_Entity_Up;
    }
  }
  const bool complete = kind == adapter_new_group;
  members.Hb_num_adapters = static_cast<int32_t>(static_cast<uint32_t>(last_index) + 1U);
  members.Hb_group_leader = complete ? field<uint32_t>(packet, leader_at) : 0xFFFFFFFFU;
  members.Hb_group_incarnation = complete ? field<uint32_t>(packet, group_incarnation_at) : 0xFFFFFFFFU;
  expected_.Hb_group_status = complete ? field<Hb_Group_Status>(packet, status_at) : Hb_Group_Unstable;
  expected_.Hb_group_type = Hb_Adapter_Group;
  set_event(membership_event(kind - adapter_death));
  set_subscription_name(packet);
}

void Event_Check::apply_node_event(Bytes packet) {
  const int32_t kind = field<int32_t>(packet, 0);
  const Bytes message = message_of(packet);
  Hb_Node_Membership_Grp& members = nodes_of(expected_);
  const int nodes = model_.header().max_nodes;
  touch(group_header_size + offsetof(Hb_Node_Membership_Grp, Hb_node_list) + 4 * static_cast<size_t>(nodes));
  int count = 0;
  for (int node = 0; node < nodes; ++node) {
    const auto member = field<Hb_Boolean>(message, 4 * static_cast<size_t>(node));
    members.Hb_node_list[node] = member;
    if (member == Hb_True) {
      ++count;
      nodes_[static_cast<size_t>(node)] = {
          static_cast<Hb_Node_Number>(node), kind == node_death ? Hb_Entity_Down : Hb_Entity_Up,
          kind == node_death ? Hb_Entity_State_Reason_Down : Hb_Entity_State_Reason_Up};
    }
  }
  members.Hb_num_nodes = count;
  expected_.Hb_group_type = Hb_Node_Group;
  if (kind == node_new_group) {
    expected_.Hb_group_status = field<Hb_Group_Status>(packet, status_at);
  } else {
    expected_.Hb_group_status = Hb_Group_Unstable;
    expect_failure_data(packet);
  }
  set_event(membership_event(kind - node_death));
  set_subscription_name(packet);
}

void Event_Check::apply_heartbeat(Bytes packet) {
  REQUIRE(std::memcmp(&client_hb_info, message_of(packet).data(), sizeof client_hb_info) == 0);
  set_event(512);
  set_subscription_name(packet);
}

void Event_Check::apply_configuration(Bytes packet) {
  model_.load(message_of(packet));
  changed_adapters_.clear();
  std::fill(nodes_.begin(), nodes_.end(), Hb_Node_config_state{0, unknown, Hb_Entity_State_Reason_Undef});
  expected_outputs_.events = 128;
  set_name("Hb_Config_Group");
}

void Event_Check::expect_failure_data(Bytes packet) {
  const auto id = field<std::array<char, HB_FFDC_ID_LENGTH>>(packet, ffdc_at);
  std::memcpy(expected_.Hb_ffdc_id, id.data(), id.size());
}

void Event_Check::set_event(Hb_Events events) {
  expected_outputs_.events = events;
  expected_.Hb_events = events;
}

void Event_Check::set_name(const char* name) {
  std::strncpy(expected_outputs_.name, name, sizeof expected_outputs_.name - 1);
}

void Event_Check::set_subscription_name(Bytes packet) {
  std::memset(expected_outputs_.name, 0, sizeof expected_outputs_.name);
  if (packet.size() > name_at) {
    std::memcpy(expected_outputs_.name, packet.data() + name_at,
                std::min<size_t>(packet.size() - name_at, HB_NAME_LENGTH - 1));
  }
}

void Event_Check::touch(size_t size) { touched_ = std::max(touched_, size); }

void Event_Check::compare() const {
  REQUIRE(actual_outputs_.events == expected_outputs_.events);
  REQUIRE(std::strcmp(actual_outputs_.name, expected_outputs_.name) == 0);
  REQUIRE(actual_outputs_.sequence == expected_outputs_.sequence);
  REQUIRE(std::memcmp(&actual_, &expected_, touched_) == 0);
  for (const uint32_t adapter : beyond_limit_) {
    REQUIRE(actual_.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list[adapter] ==
            expected_.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list[adapter]);
  }
}

void Event_Check::compare_tables() {
  for (const Hb_Adapter_Number number : changed_adapters_) {
    const Hb_Adapter* known = model_.find(number);
    const Hb_Adapter* found = hb_get_adap_entry(number);
    REQUIRE((known != nullptr) == (found != &HB_INVALID_ADAP));
    REQUIRE(known == nullptr || found->Hb_state == known->Hb_state);
  }
  REQUIRE(HB_INVALID_ADAP.Hb_state == Hb_Entity_Undef && HB_INVALID_ADAP.Hb_adapter_num == HB_NO_ADAPTER);
  if (!is_between(expected_.Hb_events, 1, 4) || expected_.Hb_group_type != Hb_Node_Group) {
    return;
  }
  for (int node = 0; node < model_.header().max_nodes; ++node) {
    Hb_Entity_State state{};
    Hb_Entity_State_Reason reason{};
    const bool present = model_.is_present(node);
    expect(present ? no_error : no_number,
           [&] { return hb_get_node_status_reason(static_cast<Hb_Node_Number>(node), &state, &reason); });
    const Hb_Node_config_state& last = nodes_[static_cast<size_t>(node)];
    REQUIRE(!present || last.state == unknown || (state == last.state && reason == last.reason));
  }
}

void Event_Check::forget() {
  std::memset(static_cast<void*>(&actual_), 0, touched_);
  std::memset(static_cast<void*>(&expected_), 0, touched_);
  for (const uint32_t adapter : beyond_limit_) {
    adapters_of(actual_).Hb_adapter_list[adapter] = 0;
    adapters_of(expected_).Hb_adapter_list[adapter] = 0;
  }
  for (const Hb_Adapter_Number number : changed_adapters_) {
    if (Hb_Adapter* known = model_.find(number)) {
      known->Hb_state = Hb_Entity_Up;
      hb_get_adap_entry(number)->Hb_state = Hb_Entity_Up;
    }
  }
  for (int node = 0; node < model_.header().max_nodes; ++node) {
    nodes_[static_cast<size_t>(node)].state = unknown;
  }
  beyond_limit_.clear();
  changed_adapters_.clear();
  touched_ = 0;
}

void Event_Check::spoil(const Hostile& hostile) {
  for (Hb_Group* group : {&actual_, &expected_}) {
    group->Hb_group_type = static_cast<Hb_Group_Type>(hostile.group_type);
    group->Hb_cursor = hostile.cursor;
    group->Hb_events = hostile.group_events;
  }
  touch(group_header_size);
}

}  // namespace fuzz
