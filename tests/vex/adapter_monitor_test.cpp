// The monitor of interfaces: what it tells of one that went down, came up, came or went.
#include "VEX_EVMONAdapterEventHandler.h"

#include <functional>

#include "monitored_cluster.h"
#include "support/allocation_faults.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

char en0[] = "en0";
char en1[] = "en1";
char en7[] = "en7";

class AdapterMonitor : public MonitorTest<EVMONAdapterEventHandler> {
 protected:
  AdapterMonitor() { Monitored_Client::subscribe(); }

  static zu_evm_event_adapter_liveness_t notification(zu_evm_event_type_t type, uint32_t node, char* interface) {
    return {type, node, 5, 9, 0, interface};
  }
  // What happens to the interface, and the notification of it.
  Hb_Rc down(uint32_t node, char* interface) {
    set_status(node, interface, ZU_VEX_INTF_STATUS_DOWN);
    return take(notification(ZU_EVM_EVENT_DOWN, node, interface));
  }
  Hb_Rc up(uint32_t node, char* interface) {
    set_status(node, interface, ZU_VEX_INTF_STATUS_UP);
    return take(notification(ZU_EVM_EVENT_UP, node, interface));
  }
  static void set_status(uint32_t node, const char* name, zu_vex_intf_status_t status) {
    for (Scripted_Interface& each : scripted_cluster().interfaces) {
      if (name != nullptr && each.node == node && each.name == name) each.status = status;
    }
  }

  // A table of nodes with 96 adapters each, of which one has en7 twice.
  static void fill_table_of_wide_nodes(Hb_Adapter_Number first) {
    empty_global_config_table(&global_config_tbl);
    Hb_Configuration_Internal& table = global_config_tbl;
    table.Hb_max_nodes = 2049;
    table.Hb_adapters_per_node = 96;
    table.Hb_num_adapters = 2;
    table.Hb_global_adapter_list = new Hb_Adapter[2]();
    table.adap_hash = Hash_init("adapters", 7);
    for (uint32_t index = 0; index < 2; ++index) {
      Hb_Adapter& wide = table.Hb_global_adapter_list[index];
      wide.Hb_adapter_num = first + index;
      wide.Hb_state = Hb_Entity_Up;
      std::strcpy(wide.Hb_adapter_type, "en7");
      Hash_insert(wide.Hb_adapter_num, table.adap_hash, &wide);
    }
  }

  // The list without members, and the group otherwise as it was.
  bool is_only_list_cleared() const {
    GroupBytes expected(*EventOutputs().group);
    expected.put(72, Bytes(size_t{98352} * 4, '\xFF'));
    return expected.is(*out.group);
  }
  void expect_told(Hb_Events events, const std::set<uint32_t>& adapters) {
    EXPECT_EQ(events, out.events);
    EXPECT_EQ("adapters", name());
    EXPECT_EQ(0U, out.sequence);
    EXPECT_EQ(Hb_Adapter_Group, out.group->Hb_group_type);
    EXPECT_EQ(Hb_Group_Stable, out.group->Hb_group_status);
    EXPECT_EQ(events, out.group->Hb_events);
    EXPECT_EQ(adapters, adapters_of(*out.group));
    EXPECT_EQ(static_cast<int32_t>(adapters.size()), count_of(*out.group));
    EXPECT_EQ(minus_one, out.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_group_leader);
    EXPECT_EQ(minus_one, out.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_group_incarnation);
    expect_nothing_queued();
  }
  void expect_empty_event() {
    EXPECT_EQ(0, out.events);
    EXPECT_EQ("<EMPTY EVENT>", name());
    EXPECT_EQ(0U, out.sequence);
    EXPECT_THAT(adapters_of(*out.group), IsEmpty());
    expect_nothing_queued();
  }
  void expect_nothing_queued() {
    EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
    EXPECT_EQ(0, client.bytes_in_pipe());
  }
};

// Reading.

TEST_F(AdapterMonitor, ThatCannotBeReadFailsAndHasClearedTheListAllTheSame) {
  platform_double().errno_after_trace = 5;
  EXPECT_EQ(Hb_Failure, take_result(-1, ENXIO));
  EXPECT_EQ(ENXIO, errno);
  EXPECT_EQ(no_number, hb_get_errno());
  EXPECT_EQ(0x7A, out.events);
  EXPECT_EQ(0x7BU, out.sequence);
  EXPECT_EQ(std::string(40, 'x'), std::string(out.name, sizeof out.name));
  EXPECT_TRUE(is_only_list_cleared());
  const auto fd = static_cast<uint64_t>(descriptor());
  EXPECT_THAT(traced(), ElementsAre(Pair(221U, info), Pair(15U, errors), Pair(222U, info)));
  EXPECT_THAT(numbers_of(221), ElementsAre(fd));
  EXPECT_THAT(numbers_of(15), ElementsAre(minus_one, fd, ENXIO));
  EXPECT_THAT(numbers_of(222), ElementsAre(fd));
}

TEST_F(AdapterMonitor, ThatCannotBeReadFailsWithoutTraceAsWell) {
  Monitored_Client::trace_nothing();
  EXPECT_EQ(Hb_Failure, take_result(-4, EIO));
  EXPECT_EQ(EIO, errno);
  EXPECT_TRUE(is_only_list_cleared());
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_F(AdapterMonitor, OfAPlatformWithoutMonitorsFails) {
  scripted_cluster().has_monitors = false;
  EVMONAdapterEventHandler absent(path);
  Monitored_Client::forget_traces();
  errno = 77;
  EXPECT_EQ(Hb_Failure, absent.handler(&out.events, out.name, out.group.get(), &out.sequence));
  EXPECT_EQ(77, errno);
  EXPECT_TRUE(is_only_list_cleared());
  EXPECT_THAT(numbers_of(15), ElementsAre(minus_one, minus_one, 77));
}

TEST_F(AdapterMonitor, ClearsAsManyEntriesAsTheTableHasAdapterNumbers) {
  empty_global_config_table(&global_config_tbl);
  EXPECT_EQ(Hb_Failure, take_result(-1, 0));
  EXPECT_TRUE(out.untouched());
  global_config_tbl.Hb_max_nodes = 3;
  global_config_tbl.Hb_adapters_per_node = 2;
  EXPECT_EQ(Hb_Failure, take_result(-1, 0));
  GroupBytes expected(*EventOutputs().group);
  EXPECT_TRUE(expected.put(72, Bytes(6 * 4, '\xFF')).is(*out.group));
}

TEST_F(AdapterMonitor, ClearsNoEntryBehindTheList) {
  global_config_tbl.Hb_max_nodes = 1 << 20;
  EXPECT_EQ(Hb_Failure, take_result(-1, 0));
  EXPECT_TRUE(is_only_list_cleared());
}

TEST_F(AdapterMonitor, WithNothingToReadIsTheEventNone) {
  scripted_cluster().wake(descriptor());
  errno = 77;
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(77, errno);
  EXPECT_EQ(0, out.events);
  EXPECT_EQ(0x7BU, out.sequence);
  EXPECT_TRUE(is_only_list_cleared());
  EXPECT_THAT(traced(), ElementsAre(Pair(221U, info), Pair(238U, info), Pair(222U, info)));
}

TEST_F(AdapterMonitor, WithARecordThatIsNoneFailsAsAReadDoes) {
  EXPECT_EQ(Hb_Failure, take_result(0, 0));
  EXPECT_EQ(0U, numbers_of(15).at(0));
}

TEST_F(AdapterMonitor, IsArmedForChangesOfTheWholeCluster) {
  const Platform_Question& opened = scripted_cluster().asked.back();
  EXPECT_EQ("BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n", std::string(opened.init_string.c_str()));
  EXPECT_EQ("BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n", std::string(p_adapterEVMONinitstr));
}

// Down and up.

TEST_F(AdapterMonitor, AnInterfaceThatWentDownIsTold) {
  errno = 77;
  EXPECT_EQ(Hb_Success, down(3, en1));
  EXPECT_EQ(77, errno);
  expect_told(1, {adapter(3, 1)});
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(3, 0));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(2, 1));
  EXPECT_THAT(traced(), ElementsAre(Pair(221U, info), Pair(14U, info), Pair(44U, info), Pair(49U, info),
                                    Pair(181U, info), Pair(222U, info)));
  EXPECT_EQ("en1", platform_double().traces_of(14)[0].block_text(0));
}

TEST_F(AdapterMonitor, AnInterfaceThatCameUpIsTold) {
  Monitored_Client::mark_adapters(3, Hb_Entity_Down);
  EXPECT_EQ(Hb_Success, up(3, en0));
  expect_told(2, {adapter(3, 0)});
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(3, 0));
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
  EXPECT_EQ(1U, times_traced(182));
  EXPECT_EQ(0U, times_traced(181));
}

TEST_F(AdapterMonitor, AnInterfaceOfUnknownStateThatWentDownIsTold) {
  Monitored_Client::find(3, 0)->Hb_state = Hb_Entity_Undef;
  EXPECT_EQ(Hb_Success, down(3, en0));
  expect_told(1, {adapter(3, 0)});
}

TEST_F(AdapterMonitor, WithoutASubscriptionToNetworksTheGroupIsFilledButThereIsNoEvent) {
  networkEventSubscriptionName[0] = '\0';
  EXPECT_EQ(Hb_Success, down(3, en1));
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("<EMPTY EVENT>", name());
  EXPECT_EQ(1U, times_traced(185));
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 1)));
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
}

TEST_F(AdapterMonitor, ARepeatedNotificationIsTheEmptyEvent) {
  EXPECT_EQ(Hb_Success, up(3, en1));
  expect_empty_event();
  EXPECT_EQ(1U, times_traced(183));
  down(3, en1);
  EXPECT_EQ(Hb_Success, down(3, en1));
  expect_empty_event();
  EXPECT_EQ(2U, times_traced(183));
}

TEST_F(AdapterMonitor, TakesEveryAddressOfTheInterfaceAlong) {
  std::strcpy(Monitored_Client::find(3, 1)->Hb_adapter_type, "en0");
  EXPECT_EQ(Hb_Success, down(3, en0));
  expect_told(1, {adapter(3, 0), adapter(3, 1)});
  EXPECT_EQ(2U, times_traced(49));
  EXPECT_EQ(2U, times_traced(181));
}

TEST_F(AdapterMonitor, TellsOfAnInterfacesAddressesThoseThatChange) {
  std::strcpy(Monitored_Client::find(3, 1)->Hb_adapter_type, "en0");
  Monitored_Client::find(3, 1)->Hb_state = Hb_Entity_Down;
  EXPECT_EQ(Hb_Success, down(3, en0));
  expect_told(1, {adapter(3, 0)});
  EXPECT_EQ(0U, times_traced(183));
}

TEST_F(AdapterMonitor, AChangeHoldsAlsoInATableThatWaitsToTakeEffect) {
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, &global_config_tbl, nullptr));
  down(3, en1);
  Monitored_Client::take_configuration();
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(3, 0));
}

TEST_F(AdapterMonitor, AnUnknownInterfaceThatWentDownIsTheEmptyEvent) {
  EXPECT_EQ(Hb_Success, down(3, en7));
  expect_empty_event();
  EXPECT_THAT(traced(),
              ElementsAre(Pair(221U, info), Pair(14U, info), Pair(44U, info), Pair(96U, info), Pair(222U, info)));
}

TEST_F(AdapterMonitor, AnUnknownInterfaceThatCameUpIsAsOneThatCame) {
  scripted_cluster().interfaces.push_back({.node = 3, .name = "en7", .address = scripted_address(1, 3, 7)});
  EXPECT_EQ(Hb_Success, up(3, en7));
  EXPECT_EQ(1U, times_traced(96));
  EXPECT_EQ(128, out.events);
  EXPECT_EQ("Hb_Config_Group", name());
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{2, {adapter(3, 2)}, 1}));
}

TEST_F(AdapterMonitor, NamesThatAgreeInTheirFirst32CharactersAreOne) {
  std::string long_name(34, 'l');
  std::strcpy(Monitored_Client::find(3, 1)->Hb_adapter_type, long_name.c_str());
  long_name[33] = 'm';
  EXPECT_EQ(Hb_Success, down(3, long_name.data()));
  expect_told(1, {adapter(3, 1)});
  EXPECT_EQ(32U, sizes_of(14).at(0));
}

TEST_F(AdapterMonitor, AMissingNameIsThatOfNoInterface) {
  EXPECT_EQ(Hb_Success, down(3, nullptr));
  expect_empty_event();
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_ADD, 3, nullptr)));
  EXPECT_EQ(16384, out.events);
}

TEST_F(AdapterMonitor, EveryOtherTypeIsTheEmptyEvent) {
  for (const int type : {4, 9, 77, -1}) {
    EXPECT_EQ(Hb_Success, take(notification(static_cast<zu_evm_event_type_t>(type), 3, en1)));
    expect_empty_event();
  }
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(3, 1));
}

class StrangeAdapters : public AdapterMonitor, public testing::WithParamInterface<uint32_t> {};

TEST_P(StrangeAdapters, AreOfNoNode) {
  EXPECT_EQ(Hb_Success, down(GetParam(), en0));
  expect_empty_event();
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_ADD, GetParam(), en0)));
  EXPECT_EQ(16384, out.events);
  for (uint32_t node = 1; node <= 4; ++node) EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(node, 0));
}

// 89478486 times 48 is 32 beyond what 32 bits hold.
INSTANTIATE_TEST_SUITE_P(Nodes, StrangeAdapters, testing::Values(9U, 2049U, 65539U, 89478486U, minus_one));

// What the cluster services say.

TEST_F(AdapterMonitor, ADeathOfAnInterfaceThatIsUpIsNoneAnyMore) {
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_DOWN, 3, en1)));
  expect_empty_event();
  EXPECT_EQ(1U, times_traced(183));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(3, 1));
}

TEST_F(AdapterMonitor, AReturnOfAnInterfaceThatIsDownIsNoneAnyMore) {
  Monitored_Client::goes_down(3);
  Monitored_Client::mark_adapters(3, Hb_Entity_Down);
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_UP, 3, en1)));
  expect_empty_event();
  EXPECT_EQ(1U, times_traced(183));
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
}

TEST_F(AdapterMonitor, OfAnInterfaceWhoseStateTheServicesDoNotKnowTheNotificationCounts) {
  const std::function<void()> unknown[] = {
      [] { Monitored_Client::interface(3, 1).status = ZU_VEX_INTF_STATUS_STALE; },
      [] { Monitored_Client::interface(3, 1).status = ZU_VEX_INTF_STATUS_UNDEF; },
      [] { Monitored_Client::interface(3, 1).status = static_cast<zu_vex_intf_status_t>(77); },
      [] {
        platform_double().net_intf_info_after_event.answers.push_back({-1, nullptr, EIO});
      },
      [] { Monitored_Client::interface(3, 1).node = 2; },
      [] { Monitored_Client::interface(3, 1) = {.node = 3, .name = "en0", .address = scripted_address(1, 3, 1)}; },
      [] { Monitored_Client::interface(3, 1) = {.node = 3, .name = "en1", .address = scripted_address(1, 3, 9)}; },
      [] {
        Monitored_Client::interface(3, 1) = {.node = 3, .name = std::nullopt, .address = scripted_address(1, 3, 1)};
      },
  };
  for (const auto& happens : unknown) {
    Monitored_Client::interface(3, 1) = {.node = 3, .name = "en1", .address = scripted_address(1, 3, 1)};
    Monitored_Client::mark_adapters(3, Hb_Entity_Up);
    happens();
    errno = 77;
    EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_DOWN, 3, en1)));
    EXPECT_EQ(77, errno);
    expect_told(1, {adapter(3, 1)});
  }
}

TEST_F(AdapterMonitor, OfAnInterfacesAddressesThoseAreLeftThatAreInTheOtherState) {
  std::strcpy(Monitored_Client::find(3, 1)->Hb_adapter_type, "en0");
  Monitored_Client::interface(3, 1).name = "en0";
  Monitored_Client::interface(3, 1).status = ZU_VEX_INTF_STATUS_DOWN;
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, &global_config_tbl, nullptr));
  Monitored_Client::find(3, 1)->Hb_state = Hb_Entity_Up;
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_DOWN, 3, en0)));
  expect_told(1, {adapter(3, 1)});
  EXPECT_EQ(0U, times_traced(183));
  Monitored_Client::take_configuration();
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(3, 0));
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
}

TEST_F(AdapterMonitor, AsksForTheInterfacesAsTheNotificationLeavesThem) {
  int category = -1;
  uint32_t node = 0;
  scripted_cluster().at_query_after_event = [&](const zu_evm_event_metadata_t* event) {
    category = event->category;
    node = event->event.p_adapter_liveness->node_number;
  };
  const size_t before = Scripted_Cluster::outstanding(Platform_Handout::net_intf_info);
  EXPECT_EQ(Hb_Success, down(3, en1));
  EXPECT_EQ(1, category);
  EXPECT_EQ(3U, node);
  EXPECT_EQ(1U, scripted_cluster().times_asked("zu_vex_get_net_intf_info_after_event"));
  EXPECT_EQ(before, Scripted_Cluster::outstanding(Platform_Handout::net_intf_info));
}

TEST_F(AdapterMonitor, WithoutAGroupTellsTheEventAlone) {
  set_status(3, en1, ZU_VEX_INTF_STATUS_DOWN);
  scripted_cluster().notify(descriptor(), notification(ZU_EVM_EVENT_DOWN, 3, en1));
  EXPECT_EQ(Hb_Success, monitor.handler(&out.events, out.name, nullptr, &out.sequence));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ("adapters", name());
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
  scripted_cluster().notify_result(descriptor(), -1, 0);
  EXPECT_EQ(Hb_Failure, monitor.handler(&out.events, out.name, nullptr, &out.sequence));
}

TEST_F(AdapterMonitor, OfANodeWithManyAdaptersEachIsLookedAt) {
  fill_table_of_wide_nodes(3 * 96 + 94);
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_DOWN, 3, en7)));
  expect_told(1, {382, 383});
}

TEST_F(AdapterMonitor, AnAdapterBeyondTheListIsNotCounted) {
  // 2049 nodes of 96 adapters have more numbers than an event has places: the last one, and the next.
  fill_table_of_wide_nodes(98351);
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_DOWN, 1024, en7)));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ(1, count_of(*out.group));
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(98351U));
}

// Coming and going.

TEST_F(AdapterMonitor, AnAliasInterfaceIsTheAliasEventAlone) {
  for (const auto type : {ZU_EVM_EVENT_ADD, ZU_EVM_EVENT_DELETE}) {
    out = EventOutputs();
    Monitored_Client::forget_traces();
    EXPECT_EQ(Hb_Success, take(notification(type, 3, en7)));
    EXPECT_EQ(16384, out.events);
    EXPECT_EQ(std::string(40, 'x'), std::string(out.name, sizeof out.name));
    EXPECT_EQ(0x7BU, out.sequence);
    EXPECT_TRUE(is_only_list_cleared());
    EXPECT_THAT(traced(), ElementsAre(Pair(221U, info), Pair(14U, info), Pair(45U, info), Pair(222U, info)));
    EXPECT_EQ("en7", platform_double().traces_of(45)[0].block_text(0));
  }
  expect_nothing_queued();
  EXPECT_EQ(0U, scripted_cluster().times_asked("zu_vex_get_net_intf_info_after_event"));
  EXPECT_EQ(0, global_config_tbl_new.Hb_num_nodes);
}

TEST_F(AdapterMonitor, ABootInterfaceThatWentIsTakenFromTheTableWithItsDeath) {
  scripted_cluster().interfaces.erase(scripted_cluster().interfaces.begin() + 5);
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_DELETE, 3, en1)));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ("adapters", name());
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 1)));
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
  EXPECT_EQ(1, client.bytes_in_pipe());
}

TEST_F(AdapterMonitor, ABootInterfaceThatCameIsInTheTableWithItsJoin) {
  scripted_cluster().interfaces.push_back({.node = 3, .name = "en1", .address = scripted_address(1, 3, 7)});
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_ADD, 3, en1)));
  EXPECT_EQ(128, out.events);
  EXPECT_EQ("Hb_Config_Group", name());
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{2, {adapter(3, 2)}, 1}));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::find(3, 2)->Hb_state);
}

TEST_F(AdapterMonitor, OfAClientThatGaveUpMovingQueuesEverythingAndDeliversNothing) {
  migrate_to_vex_prep = true;
  scripted_cluster().interfaces.erase(scripted_cluster().interfaces.begin() + 5);
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_EVENT_DELETE, 3, en1)));
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("<EMPTY EVENT>", name());
  EXPECT_EQ(0U, out.sequence);
  EXPECT_THAT(adapters_of(*out.group), IsEmpty());
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{1, {adapter(3, 1)}, 1}, configuration_event));
}

TEST_F(AdapterMonitor, WhoseInterfacesCannotBeListedFails) {
  platform_double().net_intf_info.answers.push_back({-1, nullptr});
  EXPECT_EQ(Hb_Failure, take(notification(ZU_EVM_EVENT_ADD, 3, en1)));
  EXPECT_EQ(65, hb_get_errno());
  EXPECT_EQ(0x7A, out.events);
  EXPECT_TRUE(is_only_list_cleared());
  expect_nothing_queued();
}

TEST_F(AdapterMonitor, FailsAsTheBuildOfTheTableDoes) {
  platform_double().node_info.answers.push_back({-1, nullptr});
  EXPECT_EQ(Hb_Failure, take(notification(ZU_EVM_EVENT_ADD, 3, en1)));
  EXPECT_EQ(0x7A, out.events);
  expect_nothing_queued();
}

TEST_F(AdapterMonitor, KeepsNoneOfTheListsItAskedFor) {
  const size_t before = Scripted_Cluster::outstanding(Platform_Handout::net_intf_info);
  take(notification(ZU_EVM_EVENT_ADD, 3, en1));
  EXPECT_EQ(before, Scripted_Cluster::outstanding(Platform_Handout::net_intf_info));
}

TEST_F(AdapterMonitor, NeedsNoMemoryForWhatWentDown) {
  scripted_cluster().notify(descriptor(), notification(ZU_EVM_EVENT_DOWN, 3, en1));
  platform_double().net_intf_info_after_event.answers.push_back({-1, nullptr});
  Monitored_Client::trace_nothing();
  Hb_Rc rc = Hb_Failure;
  {
    const AllocationFailure failure(1, false);
    rc = monitor.handler(&out.events, out.name, out.group.get(), &out.sequence);
  }
  EXPECT_EQ(Hb_Success, rc);
  expect_told(1, {adapter(3, 1)});
}

}  // namespace
}  // namespace hb_test
