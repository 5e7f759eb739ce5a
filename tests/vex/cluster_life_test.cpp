// A day in the life of a cluster, followed in VEX mode from start to stop through the public interface alone. After
// each step the program's picture is what the script says.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <functional>
#include <vector>

#include "VEX_migration.h"
#include "hb_client/vex.h"
#include "hb_global_data/state.h"
#include "platform_doubles.h"
#include "scripted_life.h"
#include "support/process_state.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::Field;
using testing::IsEmpty;

constexpr zu_vex_node_down_reason_t reasons[] = {
    ZU_VEX_NODE_DOWN_REASON_NONE,    ZU_VEX_NODE_DOWN_REASON_LINK_DOWN,  ZU_VEX_NODE_DOWN_REASON_SHUTDOWN,
    ZU_VEX_NODE_DOWN_REASON_STOPPED, ZU_VEX_NODE_DOWN_REASON_FORCE_DOWN,
};

class ClusterLife : public testing::Test {
 protected:
  ClusterLife() {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform();
  }

  ~ClusterLife() override {
    hb_terminate();
    EXPECT_EQ(0U, Scripted_Cluster::wrong_releases());
  }

  // A program that follows a cluster of 8 nodes and has taken the groups that its subscriptions began with.
  void start() {
    life.emplace(8);
    ASSERT_EQ(Hb_Success, caller.start());
    take();
  }

  // Everything that waits. What was taken is in `told`; empty events are left out.
  void take() {
    caller.taken.clear();
    ASSERT_GT(limit, caller.take_all(limit));
    told.clear();
    for (const Taken_Event& event : caller.taken) {
      EXPECT_EQ(Hb_Success, event.result) << event.error;
      if (event.events != HB_EVENT_NONE) {
        told.push_back(event);
      } else {
        EXPECT_THAT(event.name, testing::AnyOf("<EMPTY EVENT>", "")) << "a name is written for what was read alone";
      }
    }
  }

  void expect_true_picture() const {
    EXPECT_EQ(life->configured_nodes(), caller.configured_nodes);
    EXPECT_EQ(life->nodes_up(), caller.nodes_up);
    EXPECT_EQ(life->configured_adapters(), life->without_aliases(caller.configured_adapters));
    EXPECT_EQ(life->adapters_up(), life->without_aliases(caller.adapters_up));
    EXPECT_EQ(0, caller.unknown_adapters);
    expect_true_states();
  }

  // What the library itself says of each node and of each adapter.
  void expect_true_states() const {
    std::set<int> up;
    for (const int node : caller.configured_nodes) {
      Hb_Entity_State state = Hb_Entity_Undef;
      Hb_Entity_State_Reason reason = Hb_Entity_State_Reason_Down;
      EXPECT_EQ(Hb_Success, hb_get_node_status_reason(static_cast<Hb_Node_Number>(node), &state, &reason));
      if (state == Hb_Entity_Up) up.insert(node);
      const bool is_reason_of_up = reason == Hb_Entity_State_Reason_Up || reason == Hb_Entity_State_Reason_BRIXD_Up;
      EXPECT_EQ(state == Hb_Entity_Up, is_reason_of_up) << "node " << node << ", reason " << reason;
    }
    EXPECT_EQ(life->nodes_up(), up);
    std::set<Known_Adapter> adapters_up;
    for (int i = 0; i < global_config_tbl.Hb_num_adapters; ++i) {
      const Hb_Adapter& adapter = global_config_tbl.Hb_global_adapter_list[i];
      if (adapter.Hb_state == Hb_Entity_Up) adapters_up.insert(known(adapter));
    }
    EXPECT_EQ(life->adapters_up(), life->without_aliases(adapters_up));
  }

  static Known_Adapter known(const Hb_Adapter& adapter) {
    return {static_cast<int>(adapter.Hb_adapter_num) / global_config_tbl.Hb_adapters_per_node, adapter.Hb_adapter_type,
            hexadecimal(&adapter.Hb_ip_address, sizeof adapter.Hb_ip_address)};
  }

  // Everyone that the events of one kind named, by "node" or "node/interface".
  std::set<std::string> everyone_told(Hb_Events kind) const {
    std::set<std::string> all;
    for (const Taken_Event& event : told) {
      if (event.events != kind) continue;
      for (const int node : event.nodes) all.insert(std::to_string(node));
      for (const Known_Adapter& adapter : event.adapters) {
        all.insert(std::to_string(adapter.node) + '/' + adapter.type);
      }
    }
    return all;
  }
  std::set<std::string> deaths() const { return everyone_told(HB_EVENT_DEATH); }
  std::set<std::string> joins() const { return everyone_told(HB_EVENT_JOIN); }

  template <typename Step>
  void after(const char* what, Step step) {
    SCOPED_TRACE(testing::Message() << what << ", notification " << life->notifications());
    step();
    take();
    expect_true_picture();
  }

  // What happened is no news.
  template <typename Step>
  void after_no_news(const char* what, Step step) {
    after(what, step);
    EXPECT_THAT(told, IsEmpty()) << what << ", notification " << life->notifications();
  }

  std::vector<Hb_Events> kinds_told() const {
    std::vector<Hb_Events> kinds;
    for (const Taken_Event& event : told) {
      kinds.push_back(event.events);
    }
    return kinds;
  }

  // Parts of a day.
  void quiet_reports();
  void nodes_come_and_go();
  void interfaces_come_and_go();
  void addresses_change();
  void cluster_splits_and_merges();
  void daemon_is_lost_and_heard_of();
  void configuration_changes();
  void monitors_without_members();
  void anything_happens(size_t until);

  static constexpr size_t limit = 64;
  // The interface lists that a rebuild replaces stay allocated, by definition; hostile_platform_test counts them.
  LeakAllowed replaced_lists_stay;
  std::optional<Scripted_Life> life;
  Caller caller;
  std::vector<Taken_Event> told;
};

TEST_F(ClusterLife, SubscriptionsAreAnsweredThroughThePipeWithThePresentGroups) {
  life.emplace(8);
  scripted_cluster().nodes[6].status = ZU_VEX_NODE_STATUS_DOWN;
  scripted_cluster().interfaces[13].status = ZU_VEX_INTF_STATUS_DOWN;
  ASSERT_EQ(Hb_Success, caller.start());
  EXPECT_EQ(life->configured_nodes(), caller.configured_nodes);
  EXPECT_EQ(life->configured_adapters(), caller.configured_adapters);
  EXPECT_THAT(caller.nodes_up, IsEmpty());
  take();
  EXPECT_THAT(kinds_told(), ElementsAre(HB_EVENT_NEW_GROUP, HB_EVENT_NEW_GROUP));
  EXPECT_EQ("nodes", told[0].name);
  EXPECT_EQ("adapters", told[1].name);
  EXPECT_THAT(caller.nodes_up, ElementsAre(1, 2, 3, 4, 5, 6, 8));
  EXPECT_EQ(15U, caller.adapters_up.size());
  expect_true_picture();
}

TEST_F(ClusterLife, ADeadNodeIsToldWithItsAdaptersAndTheConfiguration) {
  start();
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_SHUTDOWN);
  take();
  EXPECT_THAT(kinds_told(), ElementsAre(HB_EVENT_DEATH, HB_EVENT_DEATH, HB_EVENT_CONFIGURATION));
  EXPECT_EQ("adapters", told[0].name);
  EXPECT_EQ(2U, told[0].adapters.size());
  EXPECT_EQ("nodes", told[1].name);
  EXPECT_THAT(told[1].nodes, ElementsAre(3));
  EXPECT_EQ("Hb_Config_Group", told[2].name);
  EXPECT_THAT(told, Each(Field(&Taken_Event::sequence, 0U)));
  expect_true_picture();
}

TEST_F(ClusterLife, AReturningNodeIsToldBeforeItsAdapters) {
  start();
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_LINK_DOWN);
  take();
  life->node_returns(3);
  take();
  EXPECT_THAT(kinds_told(), ElementsAre(HB_EVENT_JOIN, HB_EVENT_CONFIGURATION, HB_EVENT_JOIN));
  EXPECT_EQ("nodes", told[0].name);
  EXPECT_EQ("adapters", told[2].name);
  EXPECT_EQ(2U, told[2].adapters.size());
  expect_true_picture();
}

TEST_F(ClusterLife, TheAdaptersOfADeadNodeMayBeReportedStale) {
  start();
  after("death", [&] { life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_STOPPED, ZU_VEX_INTF_STATUS_STALE); });
  after("somebody else's death", [&] { life->node_dies(4, ZU_VEX_NODE_DOWN_REASON_STOPPED); });
  after("an interface", [&] { life->interface_dies(5, "en1"); });
  after("return", [&] { life->node_returns(3); });
}

TEST_F(ClusterLife, ASplitTakesTheNodesOfTheOtherPartAndAMergeBringsNobodyBack) {
  start();
  life->split_off({6, 7, 8});
  take();
  ASSERT_THAT(kinds_told(),
              ElementsAre(HB_EVENT_SUBCLUSTER_SPLIT, HB_EVENT_DEATH, HB_EVENT_DEATH, HB_EVENT_DEATH, HB_EVENT_DEATH));
  EXPECT_EQ("splits", told[0].name);
  EXPECT_THAT(told[0].local_part, ElementsAre(1, 2, 3, 4, 5));
  EXPECT_THAT(told[0].remote_part, ElementsAre(6, 7, 8));
  EXPECT_THAT(told[1].nodes, ElementsAre(6, 7, 8));
  expect_true_picture();
  life->merge({6, 7, 8});
  take();
  ASSERT_THAT(kinds_told(), ElementsAre(HB_EVENT_SUBCLUSTER_MERGE));
  EXPECT_THAT(told[0].remote_part, ElementsAre(6, 7, 8));
  expect_true_picture();
}

TEST_F(ClusterLife, ReportsThatPileUpAreTakenOneByOne) {
  start();
  life->report_node(2, ZU_EVM_EVENT_DOWN);
  life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE);
  life->report_node(2, ZU_EVM_EVENT_DOWN);
  life->report_interface(3, "en0", ZU_EVM_EVENT_UP);
  life->report_site();
  size_t calls = 0;
  while (caller.take_one()) {
    ++calls;
  }
  EXPECT_LE(5U, calls);
  expect_true_picture();
}

// Two things that happen before the program takes an event.

TEST_F(ClusterLife, WhatHappensAtOnceIsToldWithoutALoss) {
  start();
  life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE);
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_LINK_DOWN);
  life->interface_dies(4, "en1");
  life->remove_boot_address(5, 0);
  take();
  EXPECT_THAT(deaths(), ElementsAre("2", "2/en0", "2/en1", "3", "3/en0", "3/en1", "4/en1", "5/en0"));
  EXPECT_THAT(joins(), IsEmpty());
  expect_true_picture();
  life->node_returns(3);
  life->node_dies(6, ZU_VEX_NODE_DOWN_REASON_NONE);
  life->interface_returns(4, "en1");
  life->add_boot_address(5, 0);
  life->node_returns(2);
  take();
  EXPECT_THAT(deaths(), ElementsAre("6", "6/en0", "6/en1"));
  EXPECT_THAT(joins(), ElementsAre("2", "2/en0", "2/en1", "3", "3/en0", "3/en1", "4/en1", "5/en0"));
  expect_true_picture();
}

TEST_F(ClusterLife, ABootAddressThatGoesBesideADeathIsToldWithIt) {
  start();
  life->remove_boot_address(5, 1);
  life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE);
  take();
  EXPECT_THAT(deaths(), ElementsAre("2", "2/en0", "2/en1", "5/en1"));
  EXPECT_THAT(joins(), IsEmpty());
  expect_true_picture();
}

TEST_F(ClusterLife, ANodeThatIsRemovedBesideADeathIsToldWithIt) {
  start();
  life->remove_node(7);
  life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE);
  take();
  EXPECT_THAT(deaths(), ElementsAre("2", "2/en0", "2/en1", "7", "7/en0", "7/en1"));
  EXPECT_THAT(joins(), IsEmpty());
  expect_true_picture();
}

TEST_F(ClusterLife, ANewNodeThatNobodyReportsIsToldWithTheDeathBesideIt) {
  start();
  life->configure_node(9);
  life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE);
  take();
  EXPECT_THAT(deaths(), ElementsAre("2", "2/en0", "2/en1"));
  EXPECT_THAT(joins(), ElementsAre("9", "9/en0", "9/en1"));
  expect_true_picture();
}

TEST_F(ClusterLife, AnAddressThatMovesToAnotherNodeBesideADeathIsToldWithIt) {
  start();
  life->move_boot_address(4, 0, 5);
  life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE);
  take();
  EXPECT_THAT(deaths(), ElementsAre("2", "2/en0", "2/en1", "4/en0"));
  EXPECT_THAT(joins(), ElementsAre("5/en0"));
  expect_true_picture();
}

TEST_F(ClusterLife, NodesThatASplitTookReturnWithTheReportOfAnother) {
  start();
  life->split_off({6, 7});
  life->merge({6, 7});
  life->heal({6, 7});
  life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE);
  take();
  EXPECT_THAT(deaths(), ElementsAre("2", "2/en0", "2/en1", "6", "6/en0", "6/en1", "7", "7/en0", "7/en1"));
  EXPECT_THAT(joins(), ElementsAre("6", "6/en0", "6/en1", "7", "7/en0", "7/en1"));
  expect_true_picture();
}

TEST_F(ClusterLife, AnInterfaceThatReturnedBeforeItsNodeDiedDoesNotJoin) {
  start();
  after("an interface goes", [&] { life->interface_dies(3, "en1"); });
  life->interface_returns(3, "en1");
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  take();
  EXPECT_THAT(deaths(), ElementsAre("3", "3/en0"));
  EXPECT_THAT(joins(), IsEmpty());
  expect_true_picture();
}

TEST_F(ClusterLife, AnInterfaceThatWentBeforeItsNodeDiedAndReturnedDoesNotDie) {
  start();
  life->interface_dies(3, "en1");
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  life->node_returns(3);
  take();
  EXPECT_THAT(told, IsEmpty());
  expect_true_picture();
}

TEST_F(ClusterLife, AnInterfaceThatGoesWhenItsNodeHasReturnedIsToldOnce) {
  start();
  after("a death", [&] { life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE); });
  life->node_returns(3);
  life->interface_dies(3, "en1");
  take();
  EXPECT_THAT(deaths(), IsEmpty());
  EXPECT_THAT(joins(), ElementsAre("3", "3/en0"));
  expect_true_picture();
}

TEST_F(ClusterLife, ANewTableThatWaitsWhenTheClientStopsIsNotTheNextStarts) {
  start();
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  ASSERT_TRUE(caller.take_one());  // the adapters; the node and the configuration wait
  ASSERT_EQ(Hb_Success, hb_terminate());
  scripted_cluster().reset();
  life.emplace(8);
  Caller again;
  ASSERT_EQ(Hb_Success, again.start());
  again.take_all();
  EXPECT_EQ(life->nodes_up(), again.nodes_up);
  EXPECT_EQ(life->adapters_up(), again.adapters_up);
  caller.configured_nodes = again.configured_nodes;
  expect_true_states();
}

TEST_F(ClusterLife, WhoIsBackWhileTheDeathWaitsIsToldBack) {
  start();
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  hb_refresh_boot_ip_addrs_and_update_events();
  life->node_returns(3);
  hb_refresh_boot_ip_addrs_and_update_events();
  take();
  EXPECT_THAT(deaths(), ElementsAre("3", "3/en0", "3/en1"));
  EXPECT_THAT(joins(), ElementsAre("3", "3/en0", "3/en1"));
  expect_true_picture();
}

TEST_F(ClusterLife, AReturnTellsTheAdaptersAlsoWhenTheyCannotBeAskedForAgain) {
  start();
  after("a death", [&] { life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE); });
  life->node_returns(3);
  const auto present = scripted_cluster().new_interfaces(scripted_cluster().interfaces);
  platform_double().net_intf_info.answers = {{0, present}, {-1, nullptr, EIO}};
  take();
  EXPECT_THAT(joins(), ElementsAre("3", "3/en0", "3/en1"));
  expect_true_picture();
}

TEST_F(ClusterLife, StatesThatAreToldAreInForceAfterAPreparationThatWasGivenUp) {
  start();
  migrate_to_vex_prep = true;
  life->interface_dies(3, "en1");
  hb_refresh_boot_ip_addrs_and_update_events();
  ASSERT_TRUE(caller.take_one());
  life->interface_returns(3, "en1");
  take();
  migrate_to_vex_prep = false;
  expect_true_picture();
}

TEST_F(ClusterLife, WithoutSubscriptionsOnlyTheConfigurationIsFollowed) {
  life.emplace(8);
  IsVEX = Hb_True;
  ASSERT_EQ(Hb_Success, hb_initialize_evmon_event_handlers());
  Caller silent;
  silent.node_subscription = silent.adapter_subscription = silent.split_subscription = "";
  ASSERT_EQ(Hb_Success, silent.follow());
  silent.read_configuration();
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  silent.take_all();
  std::vector<Hb_Events> kinds;
  for (const Taken_Event& event : silent.taken) {
    EXPECT_EQ(Hb_Success, event.result);
    kinds.push_back(event.events);
  }
  EXPECT_THAT(kinds, ElementsAre(HB_EVENT_NONE, HB_EVENT_NONE, HB_EVENT_CONFIGURATION));
  EXPECT_EQ(life->configured_nodes(), silent.configured_nodes);
}

TEST_F(ClusterLife, AStoppedClientLeavesNoDescriptorAndStartsAgain) {
  const int descriptors = open_descriptors();
  start();
  EXPECT_LT(descriptors, open_descriptors());
  EXPECT_EQ(Hb_Success, hb_terminate());
  scripted_cluster().reset();
  EXPECT_EQ(descriptors, open_descriptors());
  Caller again;
  life.emplace(4);
  ASSERT_EQ(Hb_Success, again.start());
  again.take_all();
  EXPECT_EQ(life->nodes_up(), again.nodes_up);
  EXPECT_EQ(life->adapters_up(), again.adapters_up);
}

void ClusterLife::quiet_reports() {
  after_no_news("this node's own report", [&] { life->report_node(Scripted_Life::local_node, ZU_EVM_EVENT_UP); });
  for (uint32_t node = 2; node <= 4; ++node) {
    after_no_news("a repeated return", [&] { life->report_node(node, ZU_EVM_EVENT_UP); });
    after_no_news("a stale death", [&] { life->report_node(node, ZU_EVM_EVENT_DOWN); });
  }
  after_no_news("nothing to read", [&] { life->wake_nodes(); });
  after_no_news("nothing to read", [&] { life->wake_adapters(); });
}

void ClusterLife::nodes_come_and_go() {
  for (uint32_t node = 2; node <= 6; ++node) {
    after("a death", [&] { life->node_dies(node, reasons[node - 2]); });
    after_no_news("a repeated death", [&] { life->report_node(node, ZU_EVM_EVENT_DOWN); });
    after_no_news("a stale return", [&] { life->report_node(node, ZU_EVM_EVENT_UP); });
  }
  for (uint32_t node = 2; node <= 6; ++node) {
    after("a return", [&] { life->node_returns(node); });
    after_no_news("a repeated return", [&] { life->report_node(node, ZU_EVM_EVENT_UP); });
  }
}

void ClusterLife::interfaces_come_and_go() {
  for (uint32_t node = 1; node <= 4; ++node) {
    for (const char* name : {"en0", "en1"}) {
      after("an interface goes", [&] { life->interface_dies(node, name); });
    }
    after("an interface is reported again", [&] { life->report_interface(node, "en0", ZU_EVM_EVENT_DOWN); });
    for (const char* name : {"en1", "en0"}) {
      after("an interface returns", [&] { life->interface_returns(node, name); });
    }
    after("an interface is reported again", [&] { life->report_interface(node, "en1", ZU_EVM_EVENT_UP); });
  }
}

void ClusterLife::cluster_splits_and_merges() {
  const std::set<uint32_t> other_part = {5, 6, 7, 8};
  after("a split", [&] { life->split_off(other_part); });
  for (const uint32_t node : other_part) {
    after_no_news("the death of a node that was split off", [&] { life->report_node(node, ZU_EVM_EVENT_DOWN); });
  }
  after("a merge", [&] { life->merge(other_part); });
  for (const uint32_t node : other_part) {
    after("the return of a node that was split off", [&] { life->node_returns(node); });
  }
}

// Only the library knows that the daemon of a node is lost: the services report the node up.
void ClusterLife::daemon_is_lost_and_heard_of() {
  after("a death", [&] { life->node_dies(4, ZU_VEX_NODE_DOWN_REASON_NONE); });
  auto* node = static_cast<Hb_Node_config_state*>(Hash_search(4, global_config_tbl.node_hash));
  ASSERT_NE(nullptr, node);
  node->reason = Hb_Entity_State_Reason_BRIXD_Down;
  life->held_down.insert(4);
  scripted_cluster().nodes[3].status = ZU_VEX_NODE_STATUS_UP;
  after_no_news("a return without the daemon", [&] { life->report_node(4, ZU_EVM_EVENT_UP); });
  after("its interfaces", [&] { life->interface_returns(4, "en0"); });
  after("its interfaces", [&] { life->interface_returns(4, "en1"); });
  EXPECT_EQ(Hb_Success, hb_vex_msg_received_from(5));
  after_no_news("the daemon of a node that is up", [] {});
  EXPECT_EQ(Hb_Success, hb_vex_msg_received_from(4));
  life->held_down.clear();
  after("the daemon of the node", [] {});
  EXPECT_THAT(kinds_told(), ElementsAre(HB_EVENT_JOIN));
}

// The list of nodes is read when something else has the table rebuilt.
void ClusterLife::configuration_changes() {
  life->configure_node(9);
  after("a new node", [&] { life->report_node(9, ZU_EVM_EVENT_UP); });
  after("the new node's death", [&] { life->node_dies(9, ZU_VEX_NODE_DOWN_REASON_SHUTDOWN); });
  // Nobody tells of the removal alone: the node stays what it was, and leaves with the next report.
  life->remove_node(9);
  take();
  EXPECT_THAT(told, IsEmpty());
  EXPECT_TRUE(caller.configured_nodes.contains(9));
  EXPECT_EQ(life->nodes_up(), caller.nodes_up);
  EXPECT_EQ(life->adapters_up(), life->without_aliases(caller.adapters_up));
  after("another's death behind the removal", [&] { life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE); });
  after("another's return", [&] { life->node_returns(2); });
}

void ClusterLife::addresses_change() {
  const zu_vex_IP_address6_t alias = scripted_address(9, 9, 1);
  const zu_vex_IP_address6_t other = scripted_address(8, 8, 1);
  after("an alias comes", [&] { life->add_alias(2, "en0", alias); });
  EXPECT_THAT(kinds_told(), ElementsAre(HB_EVENT_ALIAS));
  after("an alias is reported again", [&] { life->report_address(2, "en0", alias, ZU_EVM_ADDRESS_ADD); });
  after("an interface of an alias comes", [&] { life->report_interface(2, "en7", ZU_EVM_EVENT_ADD); });
  EXPECT_THAT(kinds_told(), ElementsAre(HB_EVENT_ALIAS));
  after_no_news("an address is reported again",
                [&] { life->report_address(3, "en1", Scripted_Life::boot_address(3, 1), ZU_EVM_ADDRESS_ADD); });
  after("a boot address goes", [&] { life->remove_boot_address(3, 1); });
  EXPECT_THAT(kinds_told(), Contains(HB_EVENT_DEATH));
  after("a boot address comes", [&] { life->add_boot_address(3, 1); });
  EXPECT_THAT(kinds_told(), Contains(HB_EVENT_JOIN));
  after("an address changes", [&] { life->change_address(4, 0, other); });
  EXPECT_THAT(kinds_told(), testing::IsSupersetOf({HB_EVENT_DEATH, HB_EVENT_CONFIGURATION, HB_EVENT_JOIN}));
  after("an address changes back", [&] { life->change_address(4, 0, Scripted_Life::boot_address(4, 0)); });
  after("the node of an alias dies", [&] { life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE); });
  after("the node of an alias returns", [&] { life->node_returns(2); });
  after("an alias goes", [&] { life->remove_alias(2, "en0", alias); });
}

void ClusterLife::monitors_without_members() {
  for (int time = 0; time < 2; ++time) {
    after_no_news("a site", [&] { life->report_site(); });
    after_no_news("a process", [&] { life->report_process(); });
    after_no_news("a reconfiguration", [&] { life->report_reconfiguration(); });
  }
}

// One of what can happen at that moment, until there have been so many notifications. Always the same day.
void ClusterLife::anything_happens(size_t until) {
  uint32_t chance = 20261121;
  const auto below = [&chance](uint32_t bound) {
    chance = chance * 1664525U + 1013904223U;
    return (chance >> 16U) % bound;
  };
  while (life->notifications() < until && !HasFailure()) {
    const uint32_t node = 2 + below(7);
    const std::string name = below(2) == 0 ? "en0" : "en1";
    const uint32_t kind = below(4);
    if (kind == 0 && !life->is_up(node)) {
      after("a node returns", [&] { life->node_returns(node); });
    } else if (kind == 0) {
      after("a node dies", [&] { life->node_dies(node, reasons[below(5)]); });
    } else if (kind == 1 && life->is_up(node)) {
      const bool is_up = life->is_up(node, name);
      after("an interface", [&] { is_up ? life->interface_dies(node, name) : life->interface_returns(node, name); });
    } else {
      const auto type = static_cast<zu_evm_event_type_t>(below(2));
      after_no_news("a report without news", [&] { life->report_node(node, type); });
    }
  }
}

TEST_F(ClusterLife, TwoHundredNotificationsOfADayKeepThePictureTrue) {
  start();
  const std::vector<std::function<void()>> day = {
      [&] { quiet_reports(); },
      [&] { nodes_come_and_go(); },
      [&] { interfaces_come_and_go(); },
      [&] { monitors_without_members(); },
      [&] { addresses_change(); },
      [&] { cluster_splits_and_merges(); },
      [&] { daemon_is_lost_and_heard_of(); },
      [&] { configuration_changes(); },
      [&] { anything_happens(200); },
  };
  for (const auto& part : day) {
    ASSERT_NO_FATAL_FAILURE(part());
    ASSERT_FALSE(HasFailure());
  }
  EXPECT_EQ(200U, life->notifications());
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::cluster_info));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::node_info));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::node_liveness));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::split_merge));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::adapter_liveness));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::ip_change));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::node_list));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::site_cfg));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::process_liveness));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::cluster_reconfig));
}

}  // namespace
}  // namespace hb_test
