// VEX mode: changes of a cluster, notifications of its monitors and calls of a program, in any order and with any
// content. At the end the table in force has to be what the cluster services say.
//
// An input is a byte that says whether its steps are traced, and the steps: a byte that says which, then what it takes.
#include <poll.h>
#include <sanitizer/lsan_interface.h>
#include <unistd.h>

#include <array>
#include <cstring>
#include <set>
#include <string>
#include <tuple>
#include <vector>

#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_EVMONIPChangeEventHandler.h"
#include "VEX_EVMONNewGroupEventHandler.h"
#include "VEX_EVMONNodeListHandler.h"
#include "VEX_EVMONNodeLivenessHandler.h"
#include "VEX_EVMONPeerGSLivenessHandler.h"
#include "VEX_EVMONReconfigEventHandler.h"
#include "VEX_EVMONSiteConfigEventHandler.h"
#include "VEX_EVMONSplitMergeEventHandler.h"
#include "hb_client.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/vex_event_queue.h"
#include "platform_doubles.h"
#include "support/event_pool.h"
#include "support/input.h"
#include "support/require.h"

namespace {

using fuzz::Input;

constexpr size_t most_steps = 64;
constexpr size_t most_interfaces = 128;
constexpr int most_calls = 512;  // to take everything that waits

// Numbers near the borders come up as often as those that are there.
uint32_t take_node(Input& input) {
  static constexpr uint32_t borders[] = {0, 2047, 2048, 2049, 65537, 65538, 0x7FFFFFFF, 0x80000001, 0xFFFFFFFF};
  const auto choice = input.take<uint8_t>();
  return choice < 0xF0 ? choice % 8U : borders[choice % std::size(borders)];
}

zu_vex_IP_address6_t take_address(Input& input) {
  const auto choice = input.take<uint8_t>();
  return scripted_address(choice % 2U, choice / 128U, choice % 8U);
}

std::string take_name(Input& input) {
  static const std::string names[] = {"en0", "en1", "en2", "", std::string(300, 'n')};
  return names[input.take<uint8_t>() % std::size(names)];
}

template <typename Enum>
Enum take_enum(Input& input) {
  return static_cast<Enum>(int32_t{input.take<int8_t>()});
}

void fill_script() {
  Scripted_Cluster& cluster = scripted_cluster();
  cluster.local_node = 1;
  cluster.nodes.clear();
  cluster.interfaces.clear();
  for (uint8_t node = 1; node < 6; ++node) {
    cluster.nodes.push_back({.number = node});
    cluster.interfaces.push_back({.node = node, .name = "en0", .address = scripted_address(0, 0, node)});
    cluster.interfaces.push_back({.node = node, .name = "en1", .address = scripted_address(1, 0, node)});
  }
  cluster.boot_addresses = cluster.interfaces;
}

void subscribe_to_everything() {
  static Hb_Subscription_Group group;
  char nodes[] = "nodes";
  char adapters[] = "adapters";
  char splits[] = "splits";
  REQUIRE(hb_add_all_nodes_to_subscription_group(&group) == Hb_Success);
  REQUIRE(hb_subscribe(nodes, &group, HB_EVENT_DEATH) == Hb_Success);
  REQUIRE(hb_add_all_adapters_to_subscription_group(&group) == Hb_Success);
  REQUIRE(hb_subscribe(adapters, &group, HB_EVENT_DEATH) == Hb_Success);
  REQUIRE(hb_empty_subscription_group(&group) == Hb_Success);
  REQUIRE(hb_subscribe(splits, &group, HB_EVENT_SPLIT_MERGE) == Hb_Success);
}

// Interface lists that the library replaced and, by definition, never gives back.
class Replaced_Lists {
 public:
  // After each call that may have replaced one.
  void look() {
    if (global_vex_net_intf_tbl != known_ && known_ != nullptr) {
      hb_free_net_intf_copies(known_);
    }
    known_ = global_vex_net_intf_tbl;
  }

  // Before and after a call that gives the old one back itself.
  void forget() { known_ = nullptr; }

 private:
  zu_vex_net_intf_info_t* known_ = nullptr;
};

class Target {
 public:
  Target();
  void run(Input input);

 private:
  void step(Input& input);
  void change_cluster(Input& input);
  void notify(Input& input);
  void notify_of_members(Input& input, unsigned kind);
  void notify_of_others(Input& input, unsigned kind);
  void notify_split_merge(Input& input);
  void call(Input& input);
  void write_byte(Input& input);
  void fail_query(Input& input);
  bool take_one();
  void take_everything();
  void refresh();
  void check_outputs(Hb_Rc rc);
  static void check_table();
  void check_end();
  void restore();

  int* descriptors_ = nullptr;
  int count_ = 0;
  Replaced_Lists lists_;
  Hb_Events events_ = 0;
  Hb_Name name_ = "";
  Hb_Seq_Num sequence_ = 0;
  Hb_Group group_{};
};

// What a start keeps for the life of the process is none of a run's leaks.
Target::Target() {
  __lsan_disable();
  scripted_cluster().appear();
  platform_double().levels = {1, 1, 0};
  fill_script();
  IsVEX = Hb_True;
  REQUIRE(hb_initialize_evmon_event_handlers() == Hb_Success);
  REQUIRE(hb_get_file_descriptor_array(&descriptors_, &count_) == Hb_Success);
  refresh();
  restore();
  __lsan_enable();
}

void Target::run(Input input) {
  const bool is_traced = input.take<uint8_t>() % 8U == 0;
  platform_double().registrations.front().levels[0] = is_traced ? 1 : 0;
  platform_double().registrations.front().levels[1] = is_traced ? 1 : 0;
  for (size_t i = 0; i < most_steps && !input.empty(); ++i) {
    step(input);
    check_table();
    platform_double().traces.clear();
  }
  check_end();
  restore();
}

// To the cluster that every input starts with. A run ends with as much memory as it began with, so that the fuzzer has
// no reason to look for leaks behind each.
void Target::restore() {
  fill_script();
  subscribe_to_everything();
  refresh();
  take_everything();
  platform_double().traces.clear();
  scripted_cluster().asked.clear();
}

void Target::step(Input& input) {
  switch (input.take<uint8_t>() % 6U) {
    case 0:
      return change_cluster(input);
    case 1:
    case 2:
      return notify(input);
    case 3:
      return call(input);
    case 4:
      take_one();
      return;
    default:
      return take_everything();
  }
}

void Target::change_cluster(Input& input) {
  Scripted_Cluster& cluster = scripted_cluster();
  const auto choice = input.take<uint8_t>();
  const auto at = [&](size_t size) { return input.take<uint8_t>() % size; };
  switch (choice % 6U) {
    case 0:
      if (!cluster.nodes.empty()) {
        Scripted_Node& node = cluster.nodes[at(cluster.nodes.size())];
        node.status = take_enum<zu_vex_node_status_t>(input);
        node.reason = take_enum<zu_vex_node_down_reason_t>(input);
      }
      break;
    case 1:
      if (!cluster.interfaces.empty()) {
        cluster.interfaces[at(cluster.interfaces.size())].status = take_enum<zu_vex_intf_status_t>(input);
      }
      break;
    case 2:
      cluster.nodes.push_back({.number = take_node(input)});
      break;
    case 3:
      if (cluster.interfaces.size() < most_interfaces) {
        cluster.interfaces.push_back(
            {.node = take_node(input), .name = take_name(input), .address = take_address(input)});
      }
      break;
    case 4:
      if (!cluster.interfaces.empty()) {
        cluster.interfaces.erase(cluster.interfaces.begin() + static_cast<ptrdiff_t>(at(cluster.interfaces.size())));
      }
      break;
    default:
      if (!cluster.nodes.empty()) {
        cluster.nodes.erase(cluster.nodes.begin() + static_cast<ptrdiff_t>(at(cluster.nodes.size())));
      }
  }
}

void Target::notify(Input& input) {
  const unsigned kind = input.take<uint8_t>() % 10U;
  switch (kind) {
    case 0:
    case 1:
    case 2:
      return notify_of_members(input, kind);
    case 3:
      return notify_split_merge(input);
    case 4: {
      const int descriptor = descriptors_[input.take<uint8_t>() % static_cast<unsigned>(count_)];
      if (scripted_cluster().is_open_monitor(descriptor)) {
        scripted_cluster().notify_result(descriptor, input.take<int8_t>());
      }
      return;
    }
    default:
      return notify_of_others(input, kind);
  }
}

void Target::notify_of_members(Input& input, unsigned kind) {
  Scripted_Cluster& cluster = scripted_cluster();
  const auto type = take_enum<zu_evm_event_type_t>(input);
  const uint32_t node = take_node(input);
  if (kind == 0) {
    zu_evm_event_node_liveness_t record = {};
    record.event_type = type;
    record.node_number = node;
    return cluster.notify(node_liveness_handler_p->getFileDescriptor(), record);
  }
  std::string name = take_name(input);
  char* text = input.take<uint8_t>() % 16U != 0 ? name.data() : nullptr;
  if (kind == 1) {
    zu_evm_event_adapter_liveness_t record = {};
    record.event_type = type;
    record.node_number = node;
    record.p_interface_name = text;
    return cluster.notify(adapter_event_handler_p->getFileDescriptor(), record);
  }
  zu_evm_event_ip_change_t record = {};
  record.event_type = type;
  record.node_number = node;
  record.p_interface_name = text;
  record.ip_addr = take_address(input);
  cluster.notify(ip_change_handler_p->getFileDescriptor(), record);
}

void Target::notify_split_merge(Input& input) {
  std::array<uint32_t, 8> local{};
  std::array<uint32_t, 8> remote{};
  zu_evm_event_split_merge_cfg_t record = {};
  record.event_type = take_enum<zu_evm_event_type_t>(input);
  record.event_subtype = take_enum<zu_evm_splitmerge_event_subtype_t>(input);
  const auto take_list = [&input](std::array<uint32_t, 8>& list, uint32_t& count, uint32_t*& numbers) {
    const auto size = input.take<uint8_t>();
    numbers = size <= list.size() ? list.data() : nullptr;
    count = size <= list.size() ? size : size * 0x01010101U;
    for (uint32_t& number : list) {
      number = take_node(input);
    }
  };
  take_list(local, record.num_local_node_up, record.local_node_numbers);
  take_list(remote, record.num_remote_node_up, record.remote_node_numbers);
  const bool is_own_monitor = input.take<uint8_t>() % 8U == 0;
  scripted_cluster().notify(
      is_own_monitor ? split_merge_handler_p->getFileDescriptor() : node_liveness_handler_p->getFileDescriptor(),
      record);
}

void Target::notify_of_others(Input& input, unsigned kind) {
  Scripted_Cluster& cluster = scripted_cluster();
  const auto type = take_enum<zu_evm_event_type_t>(input);
  std::string name = take_name(input);
  switch (kind) {
    case 5: {
      zu_evm_event_node_list_t record = {};
      record.event_type = type;
      record.node_name = name.data();
      zu_evm_event_node_list_t first = record;
      first.next = &record;
      return cluster.notify(node_list_handler_p->getFileDescriptor(), first);
    }
    case 6: {
      zu_evm_event_process_liveness_t record = {};
      record.event_type = type;
      record.process_name = name.data();
      return cluster.notify(peer_GS_liveness_handler_p->getFileDescriptor(), record);
    }
    case 7: {
      zu_evm_event_cluster_reconfig_t record = {};
      record.event_type = type;
      return cluster.notify(cluster_reconfig_handler_p->getFileDescriptor(), record);
    }
    default: {
      zu_evm_event_site_cfg_t record = {};
      record.event_type = type;
      record.site_number = take_node(input);
      record.site_name = name.data();
      return cluster.notify(site_config_handler_p->getFileDescriptor(), record);
    }
  }
}

void Target::call(Input& input) {
  switch (input.take<uint8_t>() % 7U) {
    case 0:
      REQUIRE(hb_vex_msg_received_from(static_cast<Hb_Node_Number>(take_node(input))) == Hb_Success);
      return;
    case 1:
      return refresh();
    case 2:
      return subscribe_to_everything();
    case 3: {
      static constexpr const char* names[] = {"nodes", "adapters", "splits", "others"};
      Hb_Name name = "";
      std::strcpy(name, names[input.take<uint8_t>() % std::size(names)]);
      REQUIRE(hb_unsubscribe(name) == Hb_Success);
      return;
    }
    case 4: {
      // Nothing that the interface has takes a node down with its daemon.
      auto* node = static_cast<Hb_Node_config_state*>(Hash_search(take_node(input), global_config_tbl.node_hash));
      if (node != nullptr) {
        node->state = Hb_Entity_Down;
        node->reason = Hb_Entity_State_Reason_BRIXD_Down;
      }
      return;
    }
    case 5:
      return write_byte(input);
    default:
      return fail_query(input);
  }
}

void Target::write_byte(Input& input) {
  const bool is_event_pipe = input.take<uint8_t>() % 2U == 0;
  const auto byte = input.take<uint8_t>();
  const int descriptor = is_event_pipe ? event_pipe_handler_p->getWriteFd() : new_group_event_handler_p->getWriteFd();
  REQUIRE(write(descriptor, &byte, 1) == 1);
}

void Target::fail_query(Input& input) {
  Platform_Double& platform = platform_double();
  const auto which = input.take<uint8_t>();
  const int result = input.take<int8_t>() | 1;
  switch (which % 6U) {
    case 0:
      return platform.cluster_info.answers.push_back({result, nullptr});
    case 1:
      return platform.node_info.answers.push_back({result, nullptr});
    case 2:
      return platform.node_info_after_event.answers.push_back({result, nullptr});
    case 3:
      return platform.net_intf_info.answers.push_back({result, nullptr});
    case 4:
      return platform.net_intf_info_after_event.answers.push_back({result, nullptr});
    default:
      return platform.boot_addrs.answers.push_back({result, nullptr});
  }
}

bool Target::take_one() {
  std::array<pollfd, 16> polled{};
  for (int i = 0; i < count_; ++i) {
    polled[static_cast<size_t>(i)] = {descriptors_[i], POLLIN, 0};
  }
  if (poll(polled.data(), static_cast<nfds_t>(count_), 0) <= 0) {
    return false;
  }
  std::array<int, 17> ready{};
  size_t size = 0;
  for (const pollfd& one : polled) {
    if (one.revents != 0) {
      ready[size++] = one.fd;
    }
  }
  ready[size] = -1;
  events_ = HB_EVENT_NONE;
  group_.Hb_group_type = Hb_Node_Group;
  group_.Hb_membership_grp_union.split_info = {};  // a report of an unknown kind fills no lists
  std::memset(name_, 'x', sizeof name_ - 1);
  check_outputs(hb_get_event_message(ready.data(), nullptr, &events_, name_, &group_, &sequence_));
  lists_.look();
  return true;
}

void Target::check_outputs(Hb_Rc rc) {
  REQUIRE(rc == Hb_Success || rc == Hb_Failure);
  REQUIRE(std::memchr(name_, '\0', sizeof name_) != nullptr);
  REQUIRE((events_ & ~(HB_EVENT_DEATH | HB_EVENT_JOIN | HB_EVENT_NEW_GROUP | HB_EVENT_CONFIGURATION |
                       HB_EVENT_SPLIT_MERGE | HB_EVENT_ALIAS)) == 0);
  REQUIRE((events_ & (events_ - 1)) == 0);
  if (rc == Hb_Success && group_.Hb_group_type == Hb_Subcluster_Group) {
    Hb_Split_Merge_Info parts{};
    REQUIRE(hb_get_split_info(&group_, &parts) == Hb_Success);
    REQUIRE(parts.local_subcluster.num_up_nodes <= 8 && parts.remote_subcluster.num_up_nodes <= 8);
    hb_free_split_info(&parts);
  }
}

void Target::take_everything() {
  int calls = 0;
  while (take_one()) {
    REQUIRE(++calls < most_calls);
  }
}

void Target::refresh() {
  lists_.look();
  lists_.forget();
  hb_refresh_boot_ip_addrs_and_update_events();
  lists_.look();
}

// Every entry is found under its number, and there are no more than the limits say.
void Target::check_table() {
  const Hb_Configuration_Internal& table = global_config_tbl;
  REQUIRE(table.Hb_num_nodes >= 0 && table.Hb_num_nodes <= HB_MAX_NODES);
  REQUIRE(table.Hb_num_adapters >= 0 && table.Hb_num_adapters <= HB_MAX_ADAPTERS);
  for (int i = 0; i < table.Hb_num_nodes; ++i) {
    const int number = table.node_list[i].node_num;
    REQUIRE(number >= 0 && number < HB_MAX_NODES);
    REQUIRE(Hash_search(static_cast<uint32_t>(number), table.node_hash) != nullptr);
  }
  for (int i = 0; i < table.Hb_num_adapters; ++i) {
    Hb_Adapter* adapter = &table.Hb_global_adapter_list[i];
    REQUIRE(Hash_search(adapter->Hb_adapter_num, table.adap_hash) == adapter);
  }
}

typedef std::tuple<uint32_t, std::string, std::string> Adapter_Place;  // number, type, bytes of the address

std::set<Adapter_Place> adapters_of_table() {
  std::set<Adapter_Place> adapters;
  for (int i = 0; i < global_config_tbl.Hb_num_adapters; ++i) {
    const Hb_Adapter& adapter = global_config_tbl.Hb_global_adapter_list[i];
    adapters.emplace(adapter.Hb_adapter_num, adapter.Hb_adapter_type,
                     std::string(reinterpret_cast<const char*>(&adapter.Hb_ip_address), sizeof(Hb_IP_address6)));
  }
  return adapters;
}

std::set<Adapter_Place> adapters_of_script() {
  std::set<Adapter_Place> adapters;
  std::array<uint32_t, 2049> taken{};
  for (const Scripted_Interface& interface : scripted_cluster().interfaces) {
    if (interface.node < taken.size() && taken[interface.node] < 48) {
      adapters.emplace(interface.node * 48 + taken[interface.node]++, interface.name.value_or("").substr(0, 35),
                       std::string(reinterpret_cast<const char*>(&interface.address), sizeof interface.address));
    }
  }
  return adapters;
}

std::multiset<uint32_t> nodes_of_table() {
  std::multiset<uint32_t> nodes;
  for (int i = 0; i < global_config_tbl.Hb_num_nodes; ++i) {
    nodes.insert(static_cast<uint32_t>(global_config_tbl.node_list[i].node_num));
  }
  return nodes;
}

std::multiset<uint32_t> nodes_of_script() {
  std::multiset<uint32_t> nodes;
  for (const Scripted_Node& node : scripted_cluster().nodes) {
    if (node.number < 2049) {
      nodes.insert(node.number);
    }
  }
  return nodes;
}

void Target::check_end() {
  Platform_Double& platform = platform_double();
  platform.cluster_info.answers.clear();
  platform.node_info.answers.clear();
  platform.node_info_after_event.answers.clear();
  platform.net_intf_info.answers.clear();
  platform.net_intf_info_after_event.answers.clear();
  platform.boot_addrs.answers.clear();
  take_everything();
  refresh();
  take_everything();
  check_table();
  REQUIRE(VEX_event_queue_is_empty() == Hb_True);
  REQUIRE(fuzz::events_in_use() == 0);
  REQUIRE(nodes_of_table() == nodes_of_script());
  REQUIRE(adapters_of_table() == adapters_of_script());
  REQUIRE(platform.assertions.empty());
  REQUIRE(Scripted_Cluster::wrong_releases() == 0);
  const size_t kept = scripted_cluster().boot_addresses.size();
  REQUIRE(Scripted_Cluster::outstanding() == Scripted_Cluster::outstanding(Platform_Handout::net_intf_info));
  REQUIRE(Scripted_Cluster::outstanding() <= kept + most_interfaces);
  platform.traces.clear();
  scripted_cluster().asked.clear();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static Target target;
  target.run({bytes, size});
  return 0;
}
