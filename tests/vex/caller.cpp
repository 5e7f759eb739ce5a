#include "caller.h"

#include <poll.h>

#include <algorithm>

namespace hb_test {

namespace {

Hb_Group& group() {
  static Hb_Group record;
  return record;
}

template <typename Set>
void keep_only(Set& members, const Set& known) {
  std::erase_if(members, [&](const auto& member) { return !known.contains(member); });
}

// What an event of that code makes of a set that it names members of.
template <typename Set>
void change(Set& members, Hb_Events events, const Set& named) {
  if (events == HB_EVENT_NEW_GROUP) {
    members = named;
  } else if (events == HB_EVENT_JOIN) {
    members.insert(named.begin(), named.end());
  } else if (events == HB_EVENT_DEATH) {
    std::erase_if(members, [&](const auto& member) { return named.contains(member); });
  }
}

std::set<uint32_t> numbers_of(const Hb_Subcluster_Info& part) {
  return {part.node_numbers, part.node_numbers + part.num_up_nodes};
}

}  // namespace

std::string hexadecimal(const void* bytes, size_t size) {
  static constexpr char digits[] = "0123456789abcdef";
  std::string text;
  for (size_t i = 0; i < size; ++i) {
    const auto byte = static_cast<const unsigned char*>(bytes)[i];
    text += digits[byte >> 4U];
    text += digits[byte & 15U];
  }
  return text;
}

Caller::~Caller() { hb_free_file_descriptor_array(descriptors_); }

Hb_Rc Caller::start() {
  IsVEX = Hb_True;
  if (hb_initialize_evmon_event_handlers() != Hb_Success || subscribe() != Hb_Success) {
    return Hb_Failure;
  }
  read_configuration();
  return follow();
}

Hb_Rc Caller::follow() {
  hb_free_file_descriptor_array(descriptors_);
  descriptors_ = nullptr;
  descriptor_count_ = 0;
  return hb_get_file_descriptor_array(&descriptors_, &descriptor_count_);
}

Hb_Rc Caller::subscribe() {
  static Hb_Subscription_Group nodes;
  static Hb_Subscription_Group adapters;
  static Hb_Subscription_Group splits;
  const int members = HB_EVENT_DEATH | HB_EVENT_JOIN | HB_EVENT_NEW_GROUP;
  const bool subscribed = hb_add_all_nodes_to_subscription_group(&nodes) == Hb_Success &&
                          hb_subscribe(node_subscription.data(), &nodes, members) == Hb_Success &&
                          hb_add_all_adapters_to_subscription_group(&adapters) == Hb_Success &&
                          hb_subscribe(adapter_subscription.data(), &adapters, members) == Hb_Success &&
                          hb_empty_subscription_group(&splits) == Hb_Success &&
                          hb_subscribe(split_subscription.data(), &splits, HB_EVENT_SPLIT_MERGE) == Hb_Success;
  return subscribed ? Hb_Success : Hb_Failure;
}

void Caller::read_configuration() {
  configured_nodes.clear();
  configured_adapters.clear();
  by_number_.clear();
  Hb_Cursor cursor = 0;
  Hb_Node_Number node = 0;
  for (Hb_Rc rc = hb_get_first_configured_node_number(&node, &cursor); rc == Hb_Success;
       rc = hb_get_next_configured_node_number(&node, &cursor)) {
    configured_nodes.insert(node);
  }
  Hb_Adapter_Number number = 0;
  for (Hb_Rc rc = hb_get_first_configured_adapter_number(&number, &cursor); rc == Hb_Success;
       rc = hb_get_next_configured_adapter_number(&number, &cursor)) {
    Hb_IP_address6 address = {};
    Hb_Adapter_Type type = "";
    hb_get_node_number_by_adapter_number(number, &node);
    hb_get_adapter_address_by_number(number, &address);
    hb_get_adapter_type_by_number(number, type);
    const Known_Adapter adapter = {node, type, hexadecimal(&address, sizeof address)};
    configured_adapters.insert(adapter);
    by_number_.insert_or_assign(number, adapter);
  }
  keep_only(nodes_up, configured_nodes);
  keep_only(adapters_up, configured_adapters);
}

std::vector<int> Caller::readable(int milliseconds) const {
  std::vector<pollfd> polled;
  for (int i = 0; i < descriptor_count_; ++i) polled.push_back({descriptors_[i], POLLIN, 0});
  std::vector<int> ready;
  if (poll(polled.data(), polled.size(), milliseconds) > 0) {
    for (const pollfd& one : polled) {
      if (one.revents != 0) ready.push_back(one.fd);
    }
  }
  return ready;
}

bool Caller::take_one() { return take_from(readable(0)); }

void Caller::wait_and_take_one() { take_from(readable(-1)); }

bool Caller::take_from(std::vector<int> ready) {
  if (ready.empty()) {
    return false;
  }
  ready.push_back(-1);
  Taken_Event event;
  Hb_Name name = "";
  event.result = hb_get_event_message(ready.data(), nullptr, &event.events, name, &group(), &event.sequence);
  event.error = hb_get_errno();
  event.name = name;
  if (event.result == Hb_Success || event.error == HB_EEVENTPIPE) apply(event);
  taken.push_back(event);
  return true;
}

size_t Caller::take_all(size_t limit) {
  size_t count = 0;
  while (count < limit && take_one()) ++count;
  return count;
}

void Caller::apply(Taken_Event& event) {
  switch (event.events) {
    case HB_EVENT_CONFIGURATION:
      read_configuration();
      break;
    case HB_EVENT_SUBCLUSTER_SPLIT:
    case HB_EVENT_SUBCLUSTER_MERGE:
      read_parts(event);
      break;
    case HB_EVENT_DEATH:
    case HB_EVENT_JOIN:
    case HB_EVENT_NEW_GROUP:
      apply_nodes(event);
      apply_adapters(event);
      break;
    default:
      break;
  }
}

void Caller::apply_nodes(Taken_Event& event) {
  if (group().Hb_group_type != Hb_Node_Group) return;
  Hb_Node_Number node = 0;
  for (Hb_Rc rc = hb_get_first_node(&group(), &node); rc == Hb_Success; rc = hb_get_next_node(&group(), &node)) {
    event.nodes.insert(node);
  }
  change(nodes_up, event.events, event.nodes);
}

void Caller::apply_adapters(Taken_Event& event) {
  if (group().Hb_group_type != Hb_Adapter_Group) return;
  Hb_Adapter_Identifier id = {};
  for (Hb_Rc rc = hb_get_first_adapter(&group(), &id); rc == Hb_Success; rc = hb_get_next_adapter(&group(), &id)) {
    const auto known = by_number_.find(id.Hb_adapter_number);
    if (known == by_number_.end()) {
      ++unknown_adapters;
    } else {
      event.adapters.insert(known->second);
    }
  }
  change(adapters_up, event.events, event.adapters);
}

void Caller::read_parts(Taken_Event& event) {
  Hb_Split_Merge_Info parts = {};
  hb_get_split_info(&group(), &parts);
  event.local_part = numbers_of(parts.local_subcluster);
  event.remote_part = numbers_of(parts.remote_subcluster);
  hb_free_split_info(&parts);
}

}  // namespace hb_test
