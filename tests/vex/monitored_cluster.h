// A client in VEX mode over a scripted cluster, with an event pipe, and what the tests of its monitors ask about it.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <ostream>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_migration.h"
#include "hb_client.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/vex_event_queue.h"
#include "queries/event_outputs.h"
#include "support/process_state.h"
#include "support/running_client.h"

namespace hb_test {

inline constexpr int errors = 0;
inline constexpr int info = 1;
inline constexpr uint32_t minus_one = 0xFFFFFFFF;
inline constexpr int no_number = 12345;  // an error number that nothing sets

inline constexpr uint32_t local_node = 1;

// The number that the table gives the n-th address of a node.
constexpr uint32_t adapter(uint32_t node, uint32_t index) { return node * 48 + index; }

struct Queued_Event {
  Hb_Events events = 0;
  std::set<uint32_t> members = {};  // nodes or adapters, by the group's kind
  int32_t count = 0;
  int32_t status = Hb_Group_Stable;
  uint32_t type = VEX_Deliver;
  uint32_t node = 0;

  bool operator==(const Queued_Event&) const = default;
  friend std::ostream& operator<<(std::ostream& out, const Queued_Event& event) {
    out << "events " << event.events << ", status " << event.status << ", type " << event.type << " of node "
        << event.node << ", " << event.count << ":";
    for (const uint32_t member : event.members) out << ' ' << member;
    return out;
  }
};

inline const Queued_Event configuration_event = {128};

inline std::set<uint32_t> nodes_of(const Hb_Group& group) {
  std::set<uint32_t> nodes;
  for (uint32_t node = 0; node < 2049; ++node) {
    if (group.Hb_membership_grp_union.Hb_node_membership_grp.Hb_node_list[node] == Hb_True) nodes.insert(node);
  }
  return nodes;
}

// Members among the first `limit` adapter numbers.
inline std::set<uint32_t> adapters_of(const Hb_Group& group, uint32_t limit = 98352) {
  std::set<uint32_t> adapters;
  for (uint32_t number = 0; number < limit; ++number) {
    if (group.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list[number] != minus_one) {
      adapters.insert(number);
    }
  }
  return adapters;
}

inline int32_t count_of(const Hb_Group& group) {
  return group.Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes;
}

// Nodes 1 to 4, all up, with the boot addresses 10.1.<node>.0 on en0 and 10.1.<node>.1 on en1; this is node 1.
class Monitored_Client {
 public:
  Monitored_Client() {
    reset_platform(1);
    platform_double().levels = {1, 1, 0};
    Scripted_Cluster& cluster = scripted_cluster();
    cluster.appear();
    cluster.local_node = local_node;
    for (uint32_t node = 1; node <= 4; ++node) add_node(node);
    cluster.boot_addresses = cluster.interfaces;
    IsVEX = Hb_True;
    // The list of the start is left behind.
    const LeakAllowed list_stays;
    started = hb_init() == Hb_Success && number_in_order() == Hb_Success;
    make_event_pipe();
    set_hb_errno(no_number);
    forget_traces();
  }
  ~Monitored_Client() {
    drop_queue();
    empty_global_config_table(&global_config_tbl_new);
    pipe_handler.reset();
    event_pipe_handler_p = nullptr;
    hb_terminate();
    IsVEX = Hb_False;
    migrate_to_vex_prep = false;
    for (Hb_Name* name :
         {&nodeEventSubscriptionName, &networkEventSubscriptionName, &splitMergeEventSubscriptionName}) {
      (*name)[0] = '\0';
    }
  }
  Monitored_Client(const Monitored_Client&) = delete;
  Monitored_Client& operator=(const Monitored_Client&) = delete;

  static void add_node(uint32_t node, zu_vex_node_status_t status = ZU_VEX_NODE_STATUS_UP) {
    scripted_cluster().nodes.push_back({.number = node, .status = status});
    for (uint8_t index = 0; index < 2; ++index) {
      scripted_cluster().interfaces.push_back({.node = node,
                                               .name = "en" + std::to_string(index),
                                               .address = scripted_address(1, static_cast<uint8_t>(node), index)});
    }
  }

  static Scripted_Node& node(uint32_t number) { return scripted_cluster().nodes.at(number - 1); }
  static Scripted_Interface& interface(uint32_t node, uint32_t index) {
    return scripted_cluster().interfaces.at((node - 1) * 2 + index);
  }
  static void goes_down(uint32_t number, zu_vex_node_down_reason_t reason = ZU_VEX_NODE_DOWN_REASON_LINK_DOWN) {
    node(number).status = ZU_VEX_NODE_STATUS_DOWN;
    node(number).reason = reason;
    for (uint32_t index = 0; index < 2; ++index) interface(number, index).status = ZU_VEX_INTF_STATUS_DOWN;
  }
  static void comes_up(uint32_t number) {
    node(number).status = ZU_VEX_NODE_STATUS_UP;
    for (uint32_t index = 0; index < 2; ++index) interface(number, index).status = ZU_VEX_INTF_STATUS_UP;
  }

  // Marks a node in the table in force, and all its adapters with it.
  static void mark(uint32_t number, Hb_Entity_State state, Hb_Entity_State_Reason reason) {
    mark_node(number, state, reason);
    mark_adapters(number, state);
  }
  static void mark_node(uint32_t number, Hb_Entity_State state, Hb_Entity_State_Reason reason) {
    auto* found = static_cast<Hb_Node_config_state*>(Hash_search(number, global_config_tbl.node_hash));
    found->state = state;
    found->reason = reason;
  }
  static void mark_adapters(uint32_t number, Hb_Entity_State state) {
    for (uint32_t index = 0; index < 2; ++index) find(number, index)->Hb_state = state;
  }

  static Hb_Adapter* find(uint32_t number, uint32_t index) {
    return static_cast<Hb_Adapter*>(Hash_search(adapter(number, index), global_config_tbl.adap_hash));
  }
  static Hb_Entity_State state_of_adapter(uint32_t number, uint32_t index) { return find(number, index)->Hb_state; }
  static std::pair<Hb_Entity_State, Hb_Entity_State_Reason> state_of(uint32_t number) {
    const auto* found = static_cast<Hb_Node_config_state*>(Hash_search(number, global_config_tbl.node_hash));
    return {found->state, found->reason};
  }
  static bool is_configured(uint32_t number) { return Hash_search(number, global_config_tbl.node_hash) != nullptr; }

  static void subscribe() {
    std::strcpy(nodeEventSubscriptionName, "nodes");
    std::strcpy(networkEventSubscriptionName, "adapters");
    std::strcpy(splitMergeEventSubscriptionName, "splits");
  }

  static std::vector<Queued_Event> queue() {
    std::vector<Queued_Event> events;
    for (const Hb_VEX_Event* event = event_queue_list; event != nullptr; event = event->next) {
      events.push_back({.events = event->group.Hb_events,
                        .status = event->group.Hb_group_status,
                        .type = event->type,
                        .node = event->node_num});
      if (event->group.Hb_group_type == Hb_Node_Group) {
        events.back().members = nodes_of(event->group);
        events.back().count = count_of(event->group);
      } else if (event->group.Hb_group_type == Hb_Adapter_Group) {
        events.back().members = adapters_of(event->group);
        events.back().count = count_of(event->group);
      }
    }
    return events;
  }
  static void drop_queue() {
    while (Hb_VEX_Event* event = VEX_get_event_from_head()) delete event;
  }

  // The table that was built takes effect, as when the configuration event is taken.
  static void take_configuration() { VEX_copy_and_delete_global_config_tbl(); }

  // Bytes in the event pipe.
  int bytes_in_pipe() const {
    int bytes = 0;
    return ioctl(pipe_handler->getFileDescriptor(), FIONREAD, &bytes) == 0 ? bytes : -1;
  }
  void remove_event_pipe() {
    event_pipe_handler_p = nullptr;
    pipe_handler.reset();
  }

  static void forget_traces() { platform_double().traces.clear(); }
  static void trace_nothing() { platform_double().set_levels({0, 0, 0}); }

  bool started = false;
  std::unique_ptr<EVMONEventPipeHandler> pipe_handler;

 private:
  // A start numbers the addresses of a node from the last one, a rebuild from the first.
  static Hb_Rc number_in_order() { return hb_vex_update_global_tbl(&global_config_tbl, nullptr, nullptr, nullptr); }

  void make_event_pipe() {
    int32_t ends[2] = {-1, -1};
    if (pipe(ends) != 0) return;
    char label[] = "events";
    pipe_handler = std::make_unique<EVMONEventPipeHandler>(ends, label);
    event_pipe_handler_p = pipe_handler.get();
  }
};

// A client and one monitor, from which nothing may be left that it read.
template <typename Handler>
class MonitorTest : public testing::Test {
 protected:
  MonitorTest() { Monitored_Client::forget_traces(); }

  void SetUp() override { ASSERT_TRUE(client.started); }
  void TearDown() override {
    for (const Platform_Handout kind :
         {Platform_Handout::node_liveness, Platform_Handout::split_merge, Platform_Handout::adapter_liveness,
          Platform_Handout::ip_change, Platform_Handout::node_list, Platform_Handout::process_liveness,
          Platform_Handout::cluster_reconfig, Platform_Handout::repository_disk, Platform_Handout::site_cfg}) {
      EXPECT_EQ(0U, Scripted_Cluster::outstanding(kind));
    }
    EXPECT_EQ(0U, Scripted_Cluster::wrong_releases());
  }

  int descriptor() { return monitor.getFileDescriptor(); }

  // What becomes the list of boot interfaces replaces a list that is left behind.
  Hb_Rc take() {
    const LeakAllowed list_stays;
    return monitor.handler(&out.events, out.name, out.group.get(), &out.sequence);
  }

  template <typename Record>
  Hb_Rc take(const Record& record) {
    scripted_cluster().notify(descriptor(), record);
    return take();
  }

  Hb_Rc take_result(int result, int error) {
    scripted_cluster().notify_result(descriptor(), result, error);
    return take();
  }

  std::string name() const { return out.name; }
  std::string group_bytes() const { return {reinterpret_cast<const char*>(out.group.get()), sizeof *out.group}; }
  bool is_group_untouched() const { return group_bytes() == std::string(sizeof *out.group, 0x5A); }

  Monitored_Client client;
  char path[16] = "monitor";
  Handler monitor{path};
  EventOutputs out;
};

// Trace.

inline std::vector<std::pair<uint32_t, int>> traced() {
  std::vector<std::pair<uint32_t, int>> records;
  for (const Recorded_Trace& trace : platform_double().traces) records.emplace_back(trace.id, trace.category);
  return records;
}

// The numbers of the only record with that id, whichever of the two forms it has: of each block up to 8 bytes.
inline std::vector<uint64_t> numbers_of(uint32_t id) {
  const std::vector<Recorded_Trace> found = platform_double().traces_of(id);
  if (found.size() != 1) return {found.size(), 0xBAD};
  std::vector<uint64_t> numbers(found[0].values.begin(), found[0].values.end());
  for (const std::vector<uint8_t>& block : found[0].blocks) {
    uint64_t number = 0;
    std::memcpy(&number, block.data(), std::min(block.size(), sizeof number));
    numbers.push_back(number);
  }
  return numbers;
}

inline size_t times_traced(uint32_t id) { return platform_double().traces_of(id).size(); }

inline std::vector<size_t> sizes_of(uint32_t id) {
  std::vector<size_t> sizes;
  const std::vector<Recorded_Trace> found = platform_double().traces_of(id);
  for (const std::vector<uint8_t>& block : found.at(0).blocks) sizes.push_back(block.size());
  return sizes;
}

}  // namespace hb_test
