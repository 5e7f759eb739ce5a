// A notification that may have changed the configuration: what is told at once, what is queued, and which table is in
// force afterwards.
#include <csignal>

#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_EVMONConfigurationHandler.h"
#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_migration.h"
#include "hb_global_data/record_index.h"
#include "table_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

// Nodes 1 to 3 with an adapter each are in force. A second event pipe of a test takes the place of the first.
class ConfigurationUpdate : public TableState {
 protected:
  ConfigurationUpdate() {
    std::signal(SIGPIPE, SIG_IGN);
    for (uint32_t node = 1; node <= 3; ++node) {
      scripted_cluster().nodes.push_back({.number = node});
      scripted_cluster().interfaces.push_back(interface_of(node, "en0", 0));
    }
    hb_vex_update_global_tbl(&global_config_tbl, nullptr, nullptr, nullptr);
    handler = std::make_unique<EVMONConfigurationHandler>(path, "");
    ends = new_pipe();
    char label[] = "events";
    pipe_handler = std::make_unique<EVMONEventPipeHandler>(ends.fds, label);
    event_pipe_handler_p = pipe_handler.get();
    set_name(networkEventSubscriptionName, "adapters");
    scripted_cluster().asked.clear();
    start_tracing();
  }
  ~ConfigurationUpdate() override {
    event_pipe_handler_p = nullptr;
    migrate_to_vex_prep = false;
  }

  static void adapter_of_node_goes_down(uint32_t node) {
    scripted_cluster().interfaces[node - 1].status = ZU_VEX_INTF_STATUS_DOWN;
  }
  static void node_goes_down(uint32_t node) { scripted_cluster().nodes[node - 1].status = ZU_VEX_NODE_STATUS_DOWN; }
  static void node_comes(uint32_t node) {
    scripted_cluster().nodes.push_back({.number = node});
    scripted_cluster().interfaces.push_back(interface_of(node, "en0", 0));
  }

  Hb_Rc update(zu_evm_event_metadata_t* event = nullptr, zu_vex_net_intf_info_t* interfaces = nullptr) {
    return handler->update_global_table_and_construct_events(&out.events, out.name, out.group.get(), &out.seqnum, event,
                                                             interfaces);
  }
  Hb_Rc update_with_notification() { return update(&notification); }

  // What is queued, in order: "adapters 1: 48", "nodes 2: 4", "configuration".
  std::vector<std::string> queued() const {
    std::vector<std::string> events;
    int32_t sequence = 0;
    for (const Hb_VEX_Event* event = event_queue_list; event != nullptr; event = event->next) {
      EXPECT_EQ(event->sequence_num, sequence + numbers_drawn);
      EXPECT_EQ(event->type, 0U);
      EXPECT_EQ(event->node_num, 0);
      ++sequence;
      events.push_back(text_of(event->group));
    }
    return events;
  }
  static std::string text_of(const Hb_Group& group) {
    std::string text = std::to_string(group.Hb_events) + ':';
    if (group.Hb_group_type == Hb_Adapter_Group) {
      const Hb_Adapter_Membership_Grp& members = group.Hb_membership_grp_union.Hb_adapter_membership_grp;
      for (uint32_t i = 0; i < 98352; ++i) text += members.Hb_adapter_list[i] == 0 ? ' ' + std::to_string(i) : "";
      return "adapters " + text;
    }
    if (group.Hb_group_type == Hb_Node_Group) {
      const Hb_Node_Membership_Grp& members = group.Hb_membership_grp_union.Hb_node_membership_grp;
      for (int i = 0; i < 2049; ++i) text += members.Hb_node_list[i] == Hb_True ? ' ' + std::to_string(i) : "";
      return "nodes " + text;
    }
    return group.Hb_events == 128 ? "configuration" : "of no kind " + text;
  }

  void expect_outputs(Hb_Events events, const std::string& name, Hb_Seq_Num sequence) const {
    EXPECT_EQ(out.events, events);
    EXPECT_EQ(std::string(out.name), name);
    EXPECT_EQ(out.seqnum, sequence);
  }
  bool is_group_untouched() const { return same_bytes(*out.group, *group_of_bytes(0x5A)); }

  // The record of one step, which has a category and no values.
  static std::vector<std::string> step(uint32_t id) { return value_lines(id); }

  // Which of the steps were traced.
  static std::vector<uint32_t> steps() {
    std::vector<uint32_t> ids;
    for (const uint32_t id : platform_double().trace_ids()) {
      if (id == 128 || id == 129 || id == 130 || id == 187 || id == 233 || id == 285) ids.push_back(id);
    }
    return ids;
  }
  static std::vector<std::string> dumped() {
    std::vector<std::string> names;
    for (const Recorded_Trace& trace : platform_double().traces_of(121)) names.push_back(trace.block_text(0));
    return names;
  }

  int32_t numbers_drawn = 0;  // before the first queued event got its own
  static constexpr Hb_Seq_Num untouched = 0x5A5A5A5A;

  char path[8] = "monitor";
  std::unique_ptr<EVMONConfigurationHandler> handler;
  Ends ends = {};
  std::unique_ptr<EVMONEventPipeHandler> pipe_handler;
  zu_evm_event_metadata_t notification = {.category = ZU_EVM_EVENT_CATEGORY_ADAPTER_LIVENESS, .event = {}};
  Handler_Outputs out;
};

TEST_F(ConfigurationUpdate, TheHandlerItselfDoesNothing) {
  EXPECT_EQ(out.call(*handler), Hb_Success);
  EXPECT_TRUE(out.is_untouched());
  EXPECT_THAT(platform_double().traces, IsEmpty());
  EXPECT_THAT(scripted_cluster().asked, IsEmpty());
}

// A table that cannot be built.

TEST_F(ConfigurationUpdate, WithoutServicesFailsAndChangesNothing) {
  scripted_cluster().has_services = false;
  const Hb_Adapter* in_force = global_config_tbl.Hb_global_adapter_list;
  platform_double().errno_after_trace = 5;
  errno = 77;
  EXPECT_EQ(update_with_notification(), Hb_Failure);
  EXPECT_EQ(errno, 77);
  EXPECT_EQ(hb_get_errno(), 63);
  EXPECT_TRUE(out.is_untouched());
  EXPECT_THAT(queued(), IsEmpty());
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, in_force);
  const std::string descriptor = std::to_string(handler->getFileDescriptor());
  EXPECT_THAT(steps(), ElementsAre(233, 285));
  EXPECT_THAT(value_lines(233), ElementsAre("Info 233: " + descriptor));
  EXPECT_THAT(value_lines(285), ElementsAre("Info 285: " + descriptor + " 3"));
  EXPECT_THAT(dumped(), ElementsAre("Update global table: old table"));
}

TEST_F(ConfigurationUpdate, WithoutServicesFailsWithoutTraceAsWell) {
  scripted_cluster().has_services = false;
  trace_nothing();
  EXPECT_EQ(update(), Hb_Failure);
  EXPECT_TRUE(out.is_untouched());
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

// What the table is built from.

TEST_F(ConfigurationUpdate, AsksBehindTheNotification) {
  EXPECT_EQ(update_with_notification(), Hb_Success);
  EXPECT_EQ(scripted_cluster().times_asked("zu_vex_get_net_intf_info_after_event"), 1U);
  EXPECT_EQ(scripted_cluster().times_asked("zu_vex_get_node_info"), 1U);
}

TEST_F(ConfigurationUpdate, TakesTheInterfacesThatItIsGiven) {
  zu_vex_net_intf_info_t* list = callers_list({interface_of(1, "en0", 0), interface_of(2, "en0", 0)});
  EXPECT_EQ(update(&notification, list), Hb_Success);
  EXPECT_EQ(scripted_cluster().times_asked("zu_vex_get_net_intf_info_after_event"), 0U);
  EXPECT_EQ(text_of(*out.group), "adapters 1: 144");
}

TEST_F(ConfigurationUpdate, CarriesStatesOverFromTheTableInForce) {
  scripted_cluster().interfaces[0].status = ZU_VEX_INTF_STATUS_STALE;
  node_of(2) = {2, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down};
  EXPECT_EQ(update(), Hb_Success);
  EXPECT_EQ(by_number(global_config_tbl, 48)->Hb_state, Hb_Entity_Up);
  EXPECT_EQ(by_node(global_config_tbl, 2)->reason, Hb_Entity_State_Reason_BRIXD_Down);
}

// No death.

TEST_F(ConfigurationUpdate, WithoutADifferenceTellsOfTheConfigurationAtOnce) {
  Hb_Adapter* before = global_config_tbl.Hb_global_adapter_list;
  EXPECT_EQ(update_with_notification(), Hb_Success);
  expect_outputs(128, "Hb_Config_Group", untouched);
  EXPECT_TRUE(is_group_untouched());
  EXPECT_THAT(queued(), IsEmpty());
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_NE(global_config_tbl.Hb_global_adapter_list, before);
  EXPECT_EQ(find_configured_adapter(48), &global_config_tbl.Hb_global_adapter_list[0]);
  EXPECT_EQ(global_config_tbl_new.Hb_global_adapter_list, nullptr);
  EXPECT_THAT(steps(), ElementsAre(233, 130, 285));
  EXPECT_THAT(step(130), ElementsAre("Info 130"));
  EXPECT_THAT(dumped(), ElementsAre("Update global table: old table", "Update global table: new table",
                                    "Update global table: current table after copy"));
}

TEST_F(ConfigurationUpdate, QueuesJoinsOfNodesBeforeThoseOfAdapters) {
  node_comes(5);
  EXPECT_EQ(update(), Hb_Success);
  expect_outputs(128, "Hb_Config_Group", untouched);
  EXPECT_THAT(queued(), ElementsAre("nodes 2: 5", "adapters 2: 240"));
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_NE(by_node(global_config_tbl, 5), nullptr);
  EXPECT_THAT(steps(), ElementsAre(233, 130, 285));
}

TEST_F(ConfigurationUpdate, AnAdapterThatWasDownAndIsGoneIsNoDeath) {
  by_number(global_config_tbl, 96)->Hb_state = Hb_Entity_Down;
  node_of(2).state = Hb_Entity_Down;
  scripted_cluster().interfaces.erase(scripted_cluster().interfaces.begin() + 1);
  scripted_cluster().nodes.erase(scripted_cluster().nodes.begin() + 1);
  EXPECT_EQ(update(), Hb_Success);
  expect_outputs(128, "Hb_Config_Group", untouched);
  EXPECT_THAT(queued(), IsEmpty());
}

// Deaths of adapters.

TEST_F(ConfigurationUpdate, DeliversTheDeathOfAdaptersToWhoHasReadANotification) {
  adapter_of_node_goes_down(2);
  adapter_of_node_goes_down(3);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  expect_outputs(1, "adapters", 0);
  EXPECT_EQ(text_of(*out.group), "adapters 1: 96 144");
  EXPECT_EQ(out.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_num_adapters, 2);
  EXPECT_THAT(queued(), ElementsAre("configuration"));
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_THAT(steps(), ElementsAre(233, 128, 285));
  EXPECT_THAT(step(128), ElementsAre("Info 128"));
}

TEST_F(ConfigurationUpdate, LeavesTheTableInForceWhileADeathIsPending) {
  const Hb_Adapter* before = global_config_tbl.Hb_global_adapter_list;
  adapter_of_node_goes_down(2);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, before);
  EXPECT_EQ(by_number(global_config_tbl, 96)->Hb_state, Hb_Entity_Up);
  EXPECT_EQ(by_number(global_config_tbl_new, 96)->Hb_state, Hb_Entity_Down);
  EXPECT_THAT(dumped(), ElementsAre("Update global table: old table", "Update global table: new table"));
}

TEST_F(ConfigurationUpdate, WithoutASubscriptionDeliversTheEmptyEventAndTheGroup) {
  networkEventSubscriptionName[0] = '\0';
  adapter_of_node_goes_down(2);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  expect_outputs(0, "<EMPTY EVENT>", 0);
  EXPECT_EQ(text_of(*out.group), "adapters 1: 96");
  EXPECT_THAT(queued(), ElementsAre("configuration"));
  EXPECT_THAT(steps(), ElementsAre(233, 128, 187, 285));
  EXPECT_THAT(step(187), ElementsAre("Info 187"));
}

TEST_F(ConfigurationUpdate, QueuesTheDeathOfAdaptersWithoutANotification) {
  adapter_of_node_goes_down(2);
  EXPECT_EQ(update(), Hb_Success);
  expect_outputs(1, "adapters", 0);
  EXPECT_TRUE(is_group_untouched());
  EXPECT_THAT(queued(), ElementsAre("adapters 1: 96", "configuration"));
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
}

TEST_F(ConfigurationUpdate, QueuesTheDeathOfAdaptersWithoutANotificationOrASubscription) {
  networkEventSubscriptionName[0] = '\0';
  adapter_of_node_goes_down(2);
  EXPECT_EQ(update(), Hb_Success);
  expect_outputs(0, "<EMPTY EVENT>", 0);
  EXPECT_THAT(queued(), ElementsAre("adapters 1: 96", "configuration"));
  EXPECT_EQ(value_lines(187).size(), 1U);
}

TEST_F(ConfigurationUpdate, WithoutAGroupDeliversTheDeathOfAdaptersAllTheSame) {
  out.group = nullptr;
  adapter_of_node_goes_down(2);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  expect_outputs(1, "adapters", 0);
  EXPECT_THAT(value_lines(67), ElementsAre("Info 67"));  // there is nothing to copy to
  EXPECT_THAT(queued(), ElementsAre("configuration"));
}

TEST_F(ConfigurationUpdate, ReleasesTheDeathThatItDelivers) {
  adapter_of_node_goes_down(2);
  trace_nothing();
  EXPECT_EQ(update_with_notification(), Hb_Success);
  while (take() != nullptr) {
  }
  const long before = live_allocations();
  EXPECT_EQ(update_with_notification(), Hb_Success);
  while (take() != nullptr) {
  }
  EXPECT_EQ(live_allocations(), before);
}

// Deaths of nodes.

TEST_F(ConfigurationUpdate, QueuesTheDeathOfNodesAndDeliversTheEmptyEvent) {
  node_goes_down(3);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  expect_outputs(0, "<EMPTY EVENT>", 0);
  EXPECT_TRUE(is_group_untouched());
  EXPECT_THAT(queued(), ElementsAre("nodes 1: 3", "configuration"));
  EXPECT_EQ(by_node(global_config_tbl, 3)->state, Hb_Entity_Up);
  EXPECT_THAT(steps(), ElementsAre(233, 129, 285));
  EXPECT_THAT(step(129), ElementsAre("Info 129"));
}

TEST_F(ConfigurationUpdate, QueuesDeathsThenTheConfigurationThenJoins) {
  adapter_of_node_goes_down(2);
  node_goes_down(2);
  node_comes(5);
  EXPECT_EQ(update(), Hb_Success);
  EXPECT_THAT(queued(), ElementsAre("adapters 1: 96", "nodes 1: 2", "configuration", "nodes 2: 5", "adapters 2: 240"));
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_EQ(by_node(global_config_tbl, 5), nullptr);
  EXPECT_THAT(steps(), ElementsAre(233, 128, 129, 285));
}

TEST_F(ConfigurationUpdate, QueuesAllButTheDeathThatItDelivers) {
  adapter_of_node_goes_down(2);
  node_goes_down(2);
  node_comes(5);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  expect_outputs(1, "adapters", 0);
  EXPECT_THAT(queued(), ElementsAre("nodes 1: 2", "configuration", "nodes 2: 5", "adapters 2: 240"));
}

TEST_F(ConfigurationUpdate, TheQueuedConfigurationTakesEffectWhenItIsTaken) {
  node_goes_down(3);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  EXPECT_EQ(out.call(*pipe_handler), Hb_Success);
  EXPECT_EQ(by_node(global_config_tbl, 3)->state, Hb_Entity_Up);
  EXPECT_EQ(out.call(*pipe_handler), Hb_Success);
  EXPECT_EQ(out.events, 128);
  EXPECT_EQ(find_configured_node(3)->state, Hb_Entity_Down);
}

TEST_F(ConfigurationUpdate, ASecondConfigurationEventLeavesTheTableInForce) {
  node_goes_down(3);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  EXPECT_THAT(queued(), ElementsAre("nodes 1: 3", "configuration", "nodes 1: 3", "configuration"));
  for (int i = 0; i < 4; ++i) EXPECT_EQ(out.call(*pipe_handler), Hb_Success);
  ASSERT_EQ(global_config_tbl.Hb_num_nodes, 3);
  EXPECT_EQ(find_configured_node(3)->state, Hb_Entity_Down);
}

// With neither deaths nor joins the refreshed table takes effect at once, and the event that waits finds none.
TEST_F(ConfigurationUpdate, ARefreshThatFindsADeadNodeBackWhileItsDeathWaitsTellsItBackBehindIt) {
  EVMONAdapterEventHandler adapters(path);
  adapter_event_handler_p = &adapters;
  node_goes_down(3);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  EXPECT_THAT(queued(), ElementsAre("nodes 1: 3", "configuration"));
  const Hb_Adapter* before = global_config_tbl.Hb_global_adapter_list;
  scripted_cluster().nodes[2].status = ZU_VEX_NODE_STATUS_UP;
  hb_refresh_boot_ip_addrs_and_update_events();
  EXPECT_THAT(queued(), ElementsAre("nodes 1: 3", "configuration", "configuration", "nodes 2: 3"));
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, before);
  for (int i = 0; i < 3; ++i) EXPECT_EQ(out.call(*pipe_handler), Hb_Success);
  EXPECT_EQ(out.events, 128);
  EXPECT_STREQ(out.name, "Hb_Config_Group");
  ASSERT_EQ(global_config_tbl.Hb_num_nodes, 3);
  EXPECT_EQ(find_configured_node(3)->state, Hb_Entity_Up);
  EXPECT_NE(find_configured_adapter(144), nullptr);
  adapter_event_handler_p = nullptr;
}

TEST_F(ConfigurationUpdate, ARefreshThatFindsTheSameDeathQueuesASecondConfigurationEventThatChangesNothing) {
  EVMONAdapterEventHandler adapters(path);
  adapter_event_handler_p = &adapters;
  node_goes_down(3);
  EXPECT_EQ(update_with_notification(), Hb_Success);
  hb_refresh_boot_ip_addrs_and_update_events();
  EXPECT_THAT(queued(), ElementsAre("nodes 1: 3", "configuration", "nodes 1: 3", "configuration"));
  for (int i = 0; i < 4; ++i) EXPECT_EQ(out.call(*pipe_handler), Hb_Success);
  ASSERT_EQ(global_config_tbl.Hb_num_nodes, 3);
  EXPECT_EQ(find_configured_node(3)->state, Hb_Entity_Down);
  adapter_event_handler_p = nullptr;
}

// A client that moves to VEX mode.

TEST_F(ConfigurationUpdate, OfAMovingClientQueuesEverything) {
  migrate_to_vex_prep = true;
  adapter_of_node_goes_down(2);
  node_goes_down(2);
  node_comes(5);
  numbers_drawn = 1;  // by the configuration event, which gets another when it is queued
  EXPECT_EQ(update_with_notification(), Hb_Success);
  expect_outputs(0, "<EMPTY EVENT>", 0);
  EXPECT_TRUE(is_group_untouched());
  EXPECT_THAT(queued(), ElementsAre("adapters 1: 96", "nodes 1: 2", "configuration", "nodes 2: 5", "adapters 2: 240"));
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_EQ(by_node(global_config_tbl, 5), nullptr);
  EXPECT_THAT(steps(), ElementsAre(233, 129, 285));
}

TEST_F(ConfigurationUpdate, OfAMovingClientWithoutADifferenceTellsNothing) {
  migrate_to_vex_prep = true;
  const Hb_Adapter* before = global_config_tbl.Hb_global_adapter_list;
  EXPECT_EQ(update(), Hb_Success);
  EXPECT_TRUE(out.is_untouched());
  EXPECT_THAT(queued(), IsEmpty());
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, before);
}

TEST_F(ConfigurationUpdate, OfAMovingClientWithNothingButStatesQueuesTheConfigurationToo) {
  migrate_to_vex_prep = true;
  adapter_of_node_goes_down(2);
  EXPECT_EQ(update(), Hb_Success);
  EXPECT_THAT(queued(), ElementsAre("adapters 1: 96", "configuration"));
}

TEST_F(ConfigurationUpdate, OfAMovingClientWithAnotherAddressQueuesTheConfiguration) {
  migrate_to_vex_prep = true;
  scripted_cluster().interfaces[1].address = scripted_address(9, 9, 9);
  numbers_drawn = 1;
  EXPECT_EQ(update(), Hb_Success);
  EXPECT_THAT(queued(), ElementsAre("adapters 1: 96", "configuration", "adapters 2: 96"));
}

// Waking the caller.

TEST_F(ConfigurationUpdate, WithoutAnEventPipeFailsAndKeepsWhatIsQueued) {
  event_pipe_handler_p = nullptr;
  node_goes_down(3);
  EXPECT_EQ(update(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 90);
  EXPECT_THAT(queued(), ElementsAre("nodes 1: 3", "configuration"));
  EXPECT_THAT(value_lines(285), ElementsAre("Info 285: " + std::to_string(handler->getFileDescriptor()) + " 3"));
}

TEST_F(ConfigurationUpdate, ThatCannotWakeTheCallerFailsAndKeepsErrno) {
  close(ends.read());
  node_goes_down(3);
  platform_double().errno_after_trace = 5;
  EXPECT_EQ(update(), Hb_Failure);
  EXPECT_EQ(errno, EPIPE);
  EXPECT_EQ(hb_get_errno(), 59);
}

// Memory.

TEST_F(ConfigurationUpdate, WithoutMemoryTellsNothingAndFindsTheSameAgain) {
  adapter_of_node_goes_down(2);
  node_goes_down(2);
  node_comes(5);
  trace_nothing();
  size_t failures = 0;
  bool happened = true;
  for (size_t nth = 1; happened; ++nth) {
    Hb_Rc rc = Hb_Success;
    {
      const AllocationFailure failure(nth);
      rc = update_with_notification();
      happened = failure.happened();
    }
    if (rc == Hb_Failure) {
      ++failures;
      EXPECT_TRUE(hb_get_errno() == 63 || hb_get_errno() == HB_ENOMEM) << nth;
      EXPECT_TRUE(out.is_untouched()) << nth;
      EXPECT_THAT(queued(), IsEmpty()) << nth;
      EXPECT_EQ(waiting_bytes(ends.read()), 0) << nth;
    } else {
      EXPECT_THAT(queued(), ElementsAre("nodes 1: 2", "configuration", "nodes 2: 5", "adapters 2: 240")) << nth;
      EXPECT_EQ(out.events, 1) << nth;
      char byte = 0;
      EXPECT_EQ(read(ends.read(), &byte, 1), 1) << nth;
      while (take() != nullptr) {
      }
      event_sequence = 0;
      out = Handler_Outputs();
    }
  }
  EXPECT_GE(failures, 13U);  // eight of the table, and five events
}

TEST_F(ConfigurationUpdate, WithoutMemoryToTakeEffectTellsNothingAndFindsTheSameAgain) {
  node_comes(5);
  trace_nothing();
  size_t failures = 0;
  for (size_t nth = 1;; ++nth) {
    set_hb_errno(untouched_number);
    const long before = live_allocations();
    Hb_Rc rc = Hb_Success;
    {
      const AllocationFailure failure(nth, false);
      rc = update_with_notification();
    }
    if (rc == Hb_Success) break;
    failures += hb_get_errno() == 70 ? 1U : 0U;
    EXPECT_TRUE(out.is_untouched()) << nth;
    EXPECT_THAT(queued(), IsEmpty()) << nth;
    EXPECT_EQ(waiting_bytes(ends.read()), 0) << nth;
    EXPECT_EQ(global_config_tbl_new.node_list, nullptr) << nth;
    EXPECT_EQ(global_num_nodes, 3) << nth;
    EXPECT_EQ(live_allocations(), before) << nth;
  }
  EXPECT_GE(failures, 8U);  // adapters, nodes and for each of three tables its record, its name and its buckets
  expect_outputs(128, "Hb_Config_Group", untouched);
  EXPECT_THAT(queued(), ElementsAre("nodes 2: 5", "adapters 2: 240"));
  EXPECT_NE(find_configured_node(5), nullptr);
}

// The death of node 3 and its configuration event are queued; memory fails when node 2 has died as well.
class UpdateWithoutMemory : public ConfigurationUpdate {
 protected:
  UpdateWithoutMemory() {
    trace_nothing();
    node_goes_down(3);
    EXPECT_EQ(update_with_notification(), Hb_Success);
    node_goes_down(2);
    node_comes(5);
  }

  // Every allocation from the n-th on fails.
  Hb_Rc update_failing_from(size_t nth) {
    const AllocationFailure failure(nth, false);
    return update_with_notification();
  }
};

TEST_F(UpdateWithoutMemory, LeavesTheOlderNewTableToItsConfigurationEvent) {
  const Hb_Node_config_state* waiting = global_config_tbl_new.node_list;
  size_t failed_events = 0;
  for (size_t nth = 1;; ++nth) {
    set_hb_errno(untouched_number);
    const long before = live_allocations();
    if (update_failing_from(nth) == Hb_Success) break;
    failed_events += hb_get_errno() == HB_ENOMEM ? 1U : 0U;
    EXPECT_EQ(live_allocations(), before) << nth;
    EXPECT_EQ(global_config_tbl_new.node_list, waiting) << nth;
    EXPECT_EQ(by_node(global_config_tbl_new, 2)->state, Hb_Entity_Up) << nth;
    EXPECT_EQ(by_node(global_config_tbl_new, 5), nullptr) << nth;
    EXPECT_EQ(global_num_nodes, 3) << nth;
    EXPECT_EQ(global_node_tbl[5], Hb_False) << nth;
    EXPECT_THAT(queued(), ElementsAre("nodes 1: 3", "configuration")) << nth;
  }
  EXPECT_GE(failed_events, 4U);  // a death, two joins and the configuration event
}

TEST_F(UpdateWithoutMemory, PutsNothingInForceThatIsNotTold) {
  size_t nth = 1;
  for (set_hb_errno(untouched_number); hb_get_errno() != HB_ENOMEM; ++nth) {
    ASSERT_EQ(update_failing_from(nth), Hb_Failure) << nth;
  }
  for (int i = 0; i < 2; ++i) EXPECT_EQ(out.call(*pipe_handler), Hb_Success);
  EXPECT_EQ(out.events, 128);
  EXPECT_EQ(find_configured_node(3)->state, Hb_Entity_Down);
  EXPECT_EQ(find_configured_node(2)->state, Hb_Entity_Up);  // its death is still to be told
  event_sequence = 0;
  EXPECT_EQ(update_with_notification(), Hb_Success);
  EXPECT_THAT(queued(), ElementsAre("nodes 1: 2", "configuration", "nodes 2: 5", "adapters 2: 240"));
}

}  // namespace
}  // namespace hb_test
