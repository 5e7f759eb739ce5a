// Building events, and filling a caller's outputs without the queue.
#include "handler_state.h"
#include "support/allocation_faults.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

typedef std::unique_ptr<Hb_VEX_Event> Event;

class Building_Handler : public EVMONHandler {
 public:
  Building_Handler() : EVMONHandler(&unused, nullptr) {}

 private:
  static int32_t unused;
};
int32_t Building_Handler::unused = -1;

Hb_Adapter_Membership_Grp& adapters_of(Hb_VEX_Event& event) {
  return event.group.Hb_membership_grp_union.Hb_adapter_membership_grp;
}

Hb_Node_Membership_Grp& nodes_of(Hb_VEX_Event& event) {
  return event.group.Hb_membership_grp_union.Hb_node_membership_grp;
}

// The named adapters of the first so many.
std::vector<int> named(Hb_VEX_Event& event, int limit) {
  std::vector<int> numbers;
  for (int number = 0; number < limit; ++number) {
    const Hb_Incarnation entry = adapters_of(event).Hb_adapter_list[number];
    EXPECT_TRUE(entry == 0 || entry == 0xFFFFFFFFU) << number;
    if (entry == 0) {
      numbers.push_back(number);
    }
  }
  return numbers;
}

std::vector<int> named_nodes(const Hb_Node_Membership_Grp& membership) {
  std::vector<int> numbers;
  for (int number = 0; number < HB_MAX_NODES; ++number) {
    if (membership.Hb_node_list[number] == 1) {
      numbers.push_back(number);
    } else {
      EXPECT_EQ(membership.Hb_node_list[number], 0) << number;
    }
  }
  return numbers;
}

class EventBuilding : public HandlerState {
 protected:
  Building_Handler handler;
};

class AdapterEvent : public EventBuilding {
 protected:
  AdapterEvent() { fill_table(global_config_tbl, 4, 3, {}, {}); }

  void name(Event& event, Hb_Events events, Hb_Adapter_Number adapter) {
    Hb_VEX_Event* built = event.release();
    handler.construct_an_adapter_event(&built, events, adapter);
    event.reset(built);
  }
};

TEST_F(AdapterEvent, NamesTheAdaptersOfEachCall) {
  Event event;
  start_tracing();
  name(event, 1, 3);
  const Hb_VEX_Event* first = event.get();
  name(event, 1, 9);
  ASSERT_EQ(event.get(), first);
  EXPECT_THAT(named(*event, 12), ElementsAre(3, 9));
  EXPECT_EQ(event->next, nullptr);
  EXPECT_EQ(event->type, 0U);
  EXPECT_EQ(event->node_num, 0U);
  EXPECT_EQ(event->site_num, 0U);
  EXPECT_EQ(event->group.Hb_group_status, Hb_Group_Stable);
  EXPECT_EQ(event->group.Hb_group_type, Hb_Adapter_Group);
  EXPECT_EQ(event->group.Hb_events, 1);
  EXPECT_EQ(adapters_of(*event).Hb_group_incarnation, 0xFFFFFFFFU);
  EXPECT_EQ(adapters_of(*event).Hb_group_leader, 0xFFFFFFFFU);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 80: 1 3", "Info 81: 1 3", "Info 81: 1 9"));
}

TEST_F(AdapterEvent, HasTheEventOfTheLastCall) {
  Event event;
  name(event, 1, 3);
  name(event, 2, 4);
  EXPECT_EQ(event->group.Hb_events, 2);
}

TEST_F(AdapterEvent, IsBuiltSilentlyWithoutTracing) {
  set_levels(0);
  Event event;
  name(event, 1, 3);
  EXPECT_THAT(named(*event, 12), ElementsAre(3));
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(AdapterEvent, NeedsAPlace) {
  start_tracing();
  handler.construct_an_adapter_event(nullptr, 1, 3);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(AdapterEvent, LeavesOutWhatItsListHasNoPlaceFor) {
  Event event;
  name(event, 1, HB_MAX_ADAPTERS);
  name(event, 1, 0xFFFFFFFFU);
  name(event, 1, HB_MAX_ADAPTERS - 1);
  EXPECT_THAT(named(*event, HB_MAX_ADAPTERS), ElementsAre(HB_MAX_ADAPTERS - 1));
}

TEST_F(AdapterEvent, IsNotBuiltWithoutMemory) {
  set_levels(0);
  Hb_VEX_Event* event = nullptr;
  {
    const AllocationFailure failure(1);
    handler.construct_an_adapter_event(&event, 1, 3);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(event, nullptr);
}

class NodeEvent : public EventBuilding {};

// The count stays 1 however many nodes are named.
TEST_F(NodeEvent, NamesTheNodesOfEachCallAndCountsOne) {
  Hb_VEX_Event* built = nullptr;
  start_tracing();
  handler.constructNodeEvent(7, &built, 1);
  const Event event(built);
  handler.constructNodeEvent(2048, &built, 2);
  ASSERT_EQ(built, event.get());
  EXPECT_THAT(named_nodes(nodes_of(*event)), ElementsAre(7, 2048));
  EXPECT_EQ(nodes_of(*event).Hb_num_nodes, 1);
  EXPECT_EQ(event->group.Hb_events, 2);
  EXPECT_EQ(event->group.Hb_group_status, Hb_Group_Stable);
  EXPECT_EQ(event->group.Hb_group_type, Hb_Node_Group);
  EXPECT_EQ(event->next, nullptr);
  EXPECT_EQ(event->type, 0U);
  EXPECT_EQ(event->node_num, 0U);
  EXPECT_EQ(event->site_num, 0U);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(NodeEvent, LeavesOutWhatItsListHasNoPlaceFor) {
  Hb_VEX_Event* built = nullptr;
  handler.constructNodeEvent(2049, &built, 1);
  const Event event(built);
  handler.constructNodeEvent(-1, &built, 1);
  EXPECT_THAT(named_nodes(nodes_of(*event)), IsEmpty());
}

TEST_F(NodeEvent, NeedsAPlace) {
  handler.constructNodeEvent(7, nullptr, 1);
  const AllocationFailure failure(1);
  Hb_VEX_Event* built = nullptr;
  handler.constructNodeEvent(7, &built, 1);
  EXPECT_EQ(built, nullptr);
  EXPECT_TRUE(failure.happened());
}

class ConfigurationEvent : public EventBuilding {};

TEST_F(ConfigurationEvent, TakesOneNumberWhenItIsBuiltAndOneWhenItIsQueued) {
  Hb_VEX_Event* built = nullptr;
  handler.constructConfigEvent(&built);
  ASSERT_NE(built, nullptr);
  EXPECT_EQ(built->sequence_num, 0);
  EXPECT_EQ(built->group.Hb_events, 128);
  EXPECT_EQ(built->next, nullptr);
  EXPECT_EQ(built->type, 0U);
  EXPECT_EQ(built->node_num, 0U);
  VEX_add_event_at_end(built);
  EXPECT_EQ(built->sequence_num, 1);
  EXPECT_EQ(event_sequence, 2);
}

TEST_F(ConfigurationEvent, IsBuiltOnce) {
  Hb_VEX_Event* built = nullptr;
  handler.constructConfigEvent(&built);
  const Event event(built);
  handler.constructConfigEvent(&built);
  EXPECT_EQ(built, event.get());
  EXPECT_EQ(event_sequence, 1);
  handler.constructConfigEvent(nullptr);
  EXPECT_EQ(event_sequence, 1);
}

TEST_F(ConfigurationEvent, IsNotBuiltWithoutMemory) {
  const AllocationFailure failure(1);
  Hb_VEX_Event* built = nullptr;
  handler.constructConfigEvent(&built);
  EXPECT_EQ(built, nullptr);
  EXPECT_EQ(event_sequence, 0);
}

// Two nodes of three adapter numbers each; adapter a has the address 10.0.0.a and the interface "en<a>".
class AdaptersOfANode : public EventBuilding {
 protected:
  AdaptersOfANode() {
    fill_table(global_config_tbl, 4, 3, {},
               {{5, Hb_Entity_Up, "en5", scripted_address(0, 0, 5)},
                {3, Hb_Entity_Up, "en3", scripted_address(0, 0, 3)},
                {4, Hb_Entity_Down, "en4", scripted_address(0, 0, 4)},
                {0, Hb_Entity_Up, "en0", scripted_address(0, 0, 0)}});
    start_tracing();
  }

  Hb_Rc build(zu_int32_t node, zu_int32_t kind) {
    static Hb_VEX_Event forgotten;
    Hb_VEX_Event* built = &forgotten;
    const Hb_Rc rc = handler.constructAdapterEventOnNode(node, &built, kind);
    event.reset(built);
    return rc;
  }

  static Hb_Entity_State state_of(Hb_Adapter_Number number) {
    return static_cast<Hb_Adapter*>(Hash_search(number, global_config_tbl.adap_hash))->Hb_state;
  }

  static Scripted_Interface interface(uint8_t adapter, zu_vex_intf_status_t status = ZU_VEX_INTF_STATUS_UP) {
    return {uint32_t{adapter} / 3, "en" + std::to_string(adapter), scripted_address(0, 0, adapter), status, 0};
  }

  Event event;
};

TEST_F(AdaptersOfANode, DieWithItWhereTheyAreUp) {
  EXPECT_EQ(build(1, 1), Hb_Success);
  ASSERT_NE(event, nullptr);
  EXPECT_THAT(named(*event, 12), ElementsAre(3, 5));
  EXPECT_EQ(event->group.Hb_events, 1);
  EXPECT_EQ(adapters_of(*event).Hb_num_adapters, 2);
  EXPECT_EQ(state_of(3), Hb_Entity_Down);
  EXPECT_EQ(state_of(5), Hb_Entity_Down);
  EXPECT_EQ(state_of(4), Hb_Entity_Down);
  EXPECT_EQ(state_of(0), Hb_Entity_Up);
}

// In the order of the list.
TEST_F(AdaptersOfANode, AreTracedAsTheyGoDown) {
  build(1, 1);
  EXPECT_THAT(trace_lines(),
              ElementsAre("Errors 79", "Errors 80: 1 5", "Info 81: 1 5", "Errors 79", "Info 81: 1 3", "Info 84: 1 2"));
  const Recorded_Trace& record = platform_double().traces[0];
  ASSERT_EQ(record.blocks.size(), 4U);
  EXPECT_EQ(record.block_text(0), "en5");
  EXPECT_EQ(record.block_value(1), 5U);
  EXPECT_EQ(record.block_value(2), 1U);
  EXPECT_EQ(record.block_value(3), 1U);
}

// A list may have a number twice; each record is one adapter that goes down.
TEST_F(AdaptersOfANode, CountAsOftenAsTheListHasThemWhenTheyDie) {
  global_config_tbl.Hb_global_adapter_list[2].Hb_adapter_num = 5;
  global_config_tbl.Hb_global_adapter_list[2].Hb_state = Hb_Entity_Up;
  EXPECT_EQ(build(1, 1), Hb_Success);
  ASSERT_NE(event, nullptr);
  EXPECT_THAT(named(*event, 12), ElementsAre(3, 5));
  EXPECT_EQ(adapters_of(*event).Hb_num_adapters, 3);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 79", "Errors 80: 1 5", "Info 81: 1 5", "Errors 79", "Info 81: 1 3",
                                         "Errors 79", "Info 81: 1 5", "Info 84: 1 3"));
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list[2].Hb_state, Hb_Entity_Down);
}

TEST_F(AdaptersOfANode, AreTracedByTheirNamesFieldAlone) {
  Hb_Adapter& adapter = global_config_tbl.Hb_global_adapter_list[0];
  std::memset(adapter.Hb_adapter_type, 'x', sizeof adapter.Hb_adapter_type);
  build(1, 1);
  EXPECT_EQ(platform_double().traces_of(79)[0].blocks[0],
            std::vector<uint8_t>(sizeof adapter.Hb_adapter_type, uint8_t{'x'}));
}

TEST_F(AdaptersOfANode, MakeNoEventWhereNoneIsUp) {
  EXPECT_EQ(build(2, 1), Hb_Success);
  EXPECT_EQ(event, nullptr);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 84: 1 0"));
  EXPECT_EQ(build(1, 1), Hb_Success);
  EXPECT_EQ(build(1, 1), Hb_Success);
  EXPECT_EQ(event, nullptr);
}

TEST_F(AdaptersOfANode, MakeNoEventOfAnotherKind) {
  EXPECT_EQ(build(1, 4), Hb_Success);
  EXPECT_EQ(event, nullptr);
  EXPECT_EQ(state_of(3), Hb_Entity_Up);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 84: 4 0"));
}

TEST_F(AdaptersOfANode, GoDownAlsoWhenNobodyTakesTheEvent) {
  EXPECT_EQ(handler.constructAdapterEventOnNode(1, nullptr, 1), Hb_Success);
  EXPECT_EQ(state_of(3), Hb_Entity_Down);
  EXPECT_THAT(platform_double().traces_of(84)[0].values, ElementsAre(1U, 2U));
}

TEST_F(AdaptersOfANode, BelongToNobodyWithoutAdaptersForEachNode) {
  global_config_tbl.Hb_adapters_per_node = 0;
  EXPECT_EQ(build(0, 1), Hb_Success);
  EXPECT_EQ(event, nullptr);
}

TEST_F(AdaptersOfANode, BelongToNoNodeBelowZero) {
  EXPECT_EQ(build(-1, 1), Hb_Success);
  EXPECT_EQ(event, nullptr);
}

TEST_F(AdaptersOfANode, StayUpWhenThereIsNoMemoryForTheirEvent) {
  set_levels(0);
  {
    const AllocationFailure failure(1);
    EXPECT_EQ(build(1, 1), Hb_Failure);
  }
  EXPECT_EQ(event, nullptr);
  EXPECT_EQ(hb_get_errno(), 17);
  EXPECT_EQ(state_of(3), Hb_Entity_Up);
  EXPECT_EQ(state_of(5), Hb_Entity_Up);
}

TEST_F(AdaptersOfANode, AreNotKnownWhereTheServicesAreAbsent) {
  errno = ENOTTY;
  platform_double().errno_after_trace = EXDEV;
  EXPECT_EQ(build(1, 2), Hb_Failure);
  EXPECT_EQ(errno, ENOTTY);
  EXPECT_EQ(event, nullptr);
  EXPECT_EQ(hb_get_errno(), 65);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 68", "Info 69: -1 25 65"));
}

TEST_F(AdaptersOfANode, AreNotKnownWhenTheQueryFails) {
  scripted_cluster().appear();
  platform_double().net_intf_info.answers = {{-9, nullptr, EIO}};
  evmon_cluster_name = new char[2]{'c', '\0'};
  EXPECT_EQ(build(1, 2), Hb_Failure);
  EXPECT_EQ(errno, EIO);
  EXPECT_EQ(hb_get_errno(), 65);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 69: -9 5 65"));
}

TEST_F(AdaptersOfANode, JoinWithItWhereTheServicesHaveThemUp) {
  scripted_cluster().appear();
  scripted_cluster().interfaces = {interface(0), interface(4), interface(3, ZU_VEX_INTF_STATUS_DOWN),
                                   interface(5, ZU_VEX_INTF_STATUS_STALE)};
  EXPECT_EQ(build(1, 2), Hb_Success);
  ASSERT_NE(event, nullptr);
  EXPECT_THAT(named(*event, 12), ElementsAre(4));
  EXPECT_EQ(event->group.Hb_events, 2);
  EXPECT_EQ(adapters_of(*event).Hb_num_adapters, 1);
  EXPECT_EQ(state_of(4), Hb_Entity_Up);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 68", "Errors 80: 2 4", "Info 81: 2 4", "Info 84: 2 1"));
  EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
  EXPECT_EQ(Scripted_Cluster::wrong_releases(), 0U);
}

TEST_F(AdaptersOfANode, JoinOnlyWhereTheConfigurationKnowsThem) {
  scripted_cluster().appear();
  Scripted_Interface other_name = interface(3);
  other_name.name = "alias0";
  Scripted_Interface other_address = interface(4);
  other_address.address = scripted_address(9, 9, 9);
  Scripted_Interface other_node = interface(0);
  other_node.node = 1;
  Scripted_Interface nameless = interface(5);
  nameless.name.reset();
  scripted_cluster().interfaces = {other_name, other_address, other_node, nameless};
  EXPECT_EQ(build(1, 2), Hb_Success);
  EXPECT_EQ(event, nullptr);
  EXPECT_EQ(state_of(4), Hb_Entity_Down);
}

TEST_F(AdaptersOfANode, CountOnceHoweverOftenTheyAreReported) {
  scripted_cluster().appear();
  scripted_cluster().interfaces = {interface(4), interface(3), interface(4)};
  EXPECT_EQ(build(1, 2), Hb_Success);
  EXPECT_THAT(named(*event, 12), ElementsAre(3, 4));
  EXPECT_EQ(adapters_of(*event).Hb_num_adapters, 2);
}

// A list that leads back into itself comes to an end.
TEST_F(AdaptersOfANode, JoinAlsoFromAListWithoutAnEnd) {
  set_levels(0);
  char name[] = "en4";
  zu_vex_net_intf_info_t record = {};
  record.node_number = 1;
  record.p_name = name;
  record.ip_addr = scripted_address(0, 0, 4);
  record.status = ZU_VEX_INTF_STATUS_UP;
  record.p_next = &record;
  platform_double().net_intf_info.answers = {{0, &record}};
  EXPECT_EQ(build(1, 2), Hb_Success);
  ASSERT_NE(event, nullptr);
  EXPECT_EQ(adapters_of(*event).Hb_num_adapters, 1);
}

// The event is taken behind the one that brings the new table into force.
TEST_F(AdaptersOfANode, JoinUnderTheNumbersOfTheTableThatIsAboutToTakeEffect) {
  fill_table(
      global_config_tbl_new, 4, 3, {},
      {{3, Hb_Entity_Up, "en4", scripted_address(0, 0, 4)}, {4, Hb_Entity_Up, "en9", scripted_address(0, 0, 9)}});
  scripted_cluster().appear();
  Scripted_Interface added = interface(4);
  added.name = "en9";
  added.address = scripted_address(0, 0, 9);
  scripted_cluster().interfaces = {interface(4), added};
  EXPECT_EQ(build(1, 2), Hb_Success);
  EXPECT_THAT(named(*event, 12), ElementsAre(3, 4));
  EXPECT_EQ(state_of(4), Hb_Entity_Up);
}

TEST_F(AdaptersOfANode, AreToldApartWhereAnAddressIsThereTwice) {
  Hb_Adapter& other = global_config_tbl.Hb_global_adapter_list[3];
  std::memcpy(&other.Hb_ip_address, &global_config_tbl.Hb_global_adapter_list[2].Hb_ip_address, 16);
  H_IPv6_key_t address;
  std::memcpy(&address, &other.Hb_ip_address, sizeof address);
  Hash_insert_IPv6(&address, global_config_tbl.ip_hash, &other);
  scripted_cluster().appear();
  scripted_cluster().interfaces = {interface(4)};
  EXPECT_EQ(build(1, 2), Hb_Success);
  EXPECT_THAT(named(*event, 12), ElementsAre(4));
}

TEST_F(AdaptersOfANode, StayDownWhenThereIsNoMemoryForTheirEvent) {
  set_levels(0);
  scripted_cluster().appear();
  scripted_cluster().interfaces = {interface(4)};
  {
    const AllocationFailure failure(1);
    EXPECT_EQ(build(1, 2), Hb_Failure);
  }
  EXPECT_EQ(event, nullptr);
  EXPECT_EQ(hb_get_errno(), 17);
  EXPECT_EQ(state_of(4), Hb_Entity_Down);
  EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
}

TEST_F(AdaptersOfANode, NeedATableToJoin) {
  empty_global_config_table(&global_config_tbl);
  scripted_cluster().appear();
  scripted_cluster().interfaces = {interface(4)};
  EXPECT_EQ(build(1, 2), Hb_Success);
  EXPECT_EQ(event, nullptr);
}

class FillingOutputs : public EventBuilding {
 protected:
  FillingOutputs() { start_tracing(); }

  Handler_Outputs out;
};

TEST_F(FillingOutputs, OfAnAdapterEventTakesTheNameOfTheSubscription) {
  set_name(networkEventSubscriptionName, "networks");
  out.events = 2;
  handler.fillInOneAdapterEvent(&out.events, out.name, out.group.get(), &out.seqnum);
  EXPECT_STREQ(out.name, "networks");
  EXPECT_EQ(out.events, 2);
  EXPECT_EQ(out.seqnum, 0U);
  const auto expected = group_of_bytes(0x5A);
  expected->Hb_group_status = Hb_Group_Stable;
  expected->Hb_group_type = Hb_Adapter_Group;
  expected->Hb_events = 2;
  expected->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_group_incarnation = 0xFFFFFFFFU;
  expected->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_group_leader = 0xFFFFFFFFU;
  EXPECT_TRUE(same_bytes(*out.group, *expected));
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(FillingOutputs, OfAnAdapterEventClearsTheEventWithoutASubscription) {
  out.events = 2;
  handler.fillInOneAdapterEvent(&out.events, out.name, out.group.get(), &out.seqnum);
  EXPECT_STREQ(out.name, "<EMPTY EVENT>");
  EXPECT_EQ(out.events, 0);
  EXPECT_EQ(out.group->Hb_events, 0);
  EXPECT_EQ(out.seqnum, 0U);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 185"));
}

TEST_F(FillingOutputs, OfAnAdapterEventMissesTheGroup) {
  set_name(networkEventSubscriptionName, "networks");
  out.events = 2;
  handler.fillInOneAdapterEvent(&out.events, out.name, nullptr, &out.seqnum);
  EXPECT_STREQ(out.name, "networks");
  EXPECT_EQ(out.events, 2);
  EXPECT_EQ(out.seqnum, 0U);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 113"));
}

TEST_F(FillingOutputs, OfANodeEventTakesTheNameOfTheSubscription) {
  set_name(nodeEventSubscriptionName, "nodes");
  handler.fillInNodeEventInfo(7, 1, out.name, out.group.get());
  EXPECT_STREQ(out.name, "nodes");
  const auto expected = group_of_bytes(0x5A);
  expected->Hb_group_status = Hb_Group_Stable;
  expected->Hb_group_type = Hb_Node_Group;
  expected->Hb_events = 1;
  Hb_Node_Membership_Grp& membership = expected->Hb_membership_grp_union.Hb_node_membership_grp;
  membership.Hb_num_nodes = 1;
  std::memset(membership.Hb_node_list, 0, sizeof membership.Hb_node_list);
  membership.Hb_node_list[7] = Hb_True;
  EXPECT_TRUE(same_bytes(*out.group, *expected));
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(FillingOutputs, OfANodeEventKeepsTheEventWithoutASubscription) {
  handler.fillInNodeEventInfo(7, 1, out.name, out.group.get());
  EXPECT_STREQ(out.name, "<EMPTY EVENT>");
  EXPECT_EQ(out.group->Hb_events, 1);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 186"));
}

TEST_F(FillingOutputs, OfANodeEventMissesTheGroup) {
  set_name(nodeEventSubscriptionName, "nodes");
  handler.fillInNodeEventInfo(7, 1, out.name, nullptr);
  EXPECT_STREQ(out.name, "nodes");
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 85"));
}

TEST_F(FillingOutputs, OfANodeEventLeavesOutWhatTheListHasNoPlaceFor) {
  for (const zu_int32_t node : {-1, 2049, INT32_MIN, INT32_MAX}) {
    handler.fillInNodeEventInfo(node, 1, out.name, out.group.get());
    EXPECT_THAT(named_nodes(out.group->Hb_membership_grp_union.Hb_node_membership_grp), IsEmpty());
  }
}

TEST_F(FillingOutputs, OfASiteEventDoesNothing) {
  handler.fillInSiteEventInfo(1, 32, out.name, out.group.get());
  EXPECT_TRUE(out.is_untouched());
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(FillingOutputs, CutsANameThatFillsItsField) {
  std::memset(nodeEventSubscriptionName, 'n', sizeof nodeEventSubscriptionName);
  handler.fillInNodeEventInfo(7, 1, out.name, out.group.get());
  EXPECT_EQ(std::string(out.name), std::string(31, 'n'));
}

TEST_F(FillingOutputs, IsSilentWithoutTracing) {
  set_levels(0);
  handler.fillInOneAdapterEvent(&out.events, out.name, nullptr, &out.seqnum);
  handler.fillInNodeEventInfo(7, 1, out.name, nullptr);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

}  // namespace
}  // namespace hb_test
