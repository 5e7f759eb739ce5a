// The monitor of addresses: what it tells of one that came, went or changed.
#include "VEX_EVMONIPChangeEventHandler.h"
#include "monitored_cluster.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

char en0[] = "en0";
char en1[] = "en1";

class IPChange : public MonitorTest<EVMONIPChangeEventHandler> {
 protected:
  IPChange() { Monitored_Client::subscribe(); }

  static zu_evm_event_ip_change_t notification(zu_evm_event_type_t type, uint32_t node, char* interface,
                                               const zu_vex_IP_address6_t& address) {
    return {type, node, 5, 9, 0, interface, address};
  }
  Hb_Rc added(uint32_t node, char* interface, const zu_vex_IP_address6_t& address) {
    return take(notification(ZU_EVM_ADDRESS_ADD, node, interface, address));
  }
  Hb_Rc deleted(uint32_t node, char* interface, const zu_vex_IP_address6_t& address) {
    return take(notification(ZU_EVM_ADDRESS_DELETE, node, interface, address));
  }

  // An address that a node starts with, and which the table does not have yet.
  static zu_vex_IP_address6_t new_boot_address() {
    const zu_vex_IP_address6_t address = scripted_address(1, 3, 9);
    scripted_cluster().interfaces.push_back({.node = 3, .name = "en1", .address = address});
    scripted_cluster().boot_addresses = scripted_cluster().interfaces;
    zu_vex_net_intf_info_t* list = nullptr;
    const LeakAllowed lists_stay;
    hb_refresh_boot_ip_addrs(&list);
    zu_vex_free_net_intf_info(list);
    return address;
  }
  static void disappears(uint32_t node, uint32_t index) {
    scripted_cluster().interfaces.erase(scripted_cluster().interfaces.begin() + (node - 1) * 2 + index);
  }

  void expect_empty_event() {
    EXPECT_EQ(0, out.events);
    EXPECT_EQ("<EMPTY EVENT>", name());
    EXPECT_EQ(0U, out.sequence);
    EXPECT_TRUE(is_group_untouched());
    expect_no_rebuild();
  }
  void expect_alias_alone() {
    EXPECT_EQ(16384, out.events);
    out.events = 0x7A;
    EXPECT_TRUE(out.untouched());
    expect_no_rebuild();
  }
  void expect_no_rebuild() {
    EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
    EXPECT_EQ(0, client.bytes_in_pipe());
    EXPECT_EQ(0U, times_traced(233));
  }
};

const zu_vex_IP_address6_t known = scripted_address(1, 3, 1);
const zu_vex_IP_address6_t alias = scripted_address(9, 9, 9);

// Reading.

TEST_F(IPChange, ThatCannotBeReadFailsAndWritesNothing) {
  platform_double().errno_after_trace = 5;
  EXPECT_EQ(Hb_Failure, take_result(-1, ENXIO));
  EXPECT_EQ(ENXIO, errno);
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(no_number, hb_get_errno());
  const auto fd = static_cast<uint64_t>(descriptor());
  EXPECT_THAT(traced(), ElementsAre(Pair(225U, info), Pair(95U, errors), Pair(226U, info)));
  EXPECT_THAT(numbers_of(225), ElementsAre(fd));
  EXPECT_THAT(numbers_of(95), ElementsAre(minus_one, fd, ENXIO));
  EXPECT_THAT(numbers_of(226), ElementsAre(fd));
}

TEST_F(IPChange, ThatCannotBeReadFailsWithoutTraceAsWell) {
  Monitored_Client::trace_nothing();
  EXPECT_EQ(Hb_Failure, take_result(-4, EIO));
  EXPECT_EQ(EIO, errno);
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_F(IPChange, OfAPlatformWithoutMonitorsFails) {
  scripted_cluster().has_monitors = false;
  EVMONIPChangeEventHandler absent(path);
  Monitored_Client::forget_traces();
  errno = 77;
  EXPECT_EQ(Hb_Failure, absent.handler(&out.events, out.name, out.group.get(), &out.sequence));
  EXPECT_EQ(77, errno);
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(numbers_of(95), ElementsAre(minus_one, minus_one, 77));
}

TEST_F(IPChange, WithNothingToReadIsTheEventNone) {
  scripted_cluster().wake(descriptor());
  errno = 77;
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(77, errno);
  EXPECT_EQ(0, out.events);
  out.events = 0x7A;
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(traced(), ElementsAre(Pair(225U, info), Pair(240U, info), Pair(226U, info)));
}

TEST_F(IPChange, WithARecordThatIsNoneFailsAsAReadDoes) {
  EXPECT_EQ(Hb_Failure, take_result(0, 0));
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(0U, numbers_of(95).at(0));
}

TEST_F(IPChange, IsArmedForChangesOfTheWholeCluster) {
  const Platform_Question& opened = scripted_cluster().asked.back();
  EXPECT_EQ("BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n", std::string(opened.init_string.c_str()));
  EXPECT_EQ("BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n", std::string(p_ipchangeEVMONinitstr));
}

TEST_F(IPChange, RecordsWhatWasRead) {
  added(3, en1, known);
  const Recorded_Trace told = platform_double().traces_of(335).at(0);
  EXPECT_EQ(info, told.category);
  EXPECT_EQ(4U, told.block_value(0));
  EXPECT_EQ(3U, told.block_value(1));
  EXPECT_EQ("en1", told.block_text(2));
  EXPECT_EQ("10.1.3.1", told.block_text(3));
}

// Coming.

TEST_F(IPChange, AnAddressThatIsKnownAndComesIsRepeated) {
  EXPECT_EQ(Hb_Success, added(3, en1, known));
  expect_empty_event();
}

TEST_F(IPChange, AnAddressThatIsInTheTableAndDownComesWithItsJoin) {
  Monitored_Client::find(3, 1)->Hb_state = Hb_Entity_Down;
  EXPECT_EQ(Hb_Success, added(3, en1, known));
  EXPECT_EQ(128, out.events);
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{2, {adapter(3, 1)}, 1}));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::find(3, 1)->Hb_state);
}

TEST_F(IPChange, AnAddressThatIsDownInTheWaitingTableAloneIsAChange) {
  scripted_cluster().interfaces[5].status = ZU_VEX_INTF_STATUS_DOWN;
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, &global_config_tbl, nullptr));
  EXPECT_EQ(Hb_Success, added(3, en1, known));
  EXPECT_EQ(1U, times_traced(233));
}

TEST_F(IPChange, AnAliasAddressThatComesIsTheAliasEventAlone) {
  EXPECT_EQ(Hb_Success, added(3, en1, alias));
  expect_alias_alone();
}

TEST_F(IPChange, ABootAddressThatComesIsInTheTableWithItsJoin) {
  const zu_vex_IP_address6_t address = new_boot_address();
  EXPECT_EQ(Hb_Success, added(3, en1, address));
  EXPECT_EQ(128, out.events);
  EXPECT_EQ("Hb_Config_Group", name());
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{2, {adapter(3, 2)}, 1}));
  EXPECT_EQ(1, client.bytes_in_pipe());
  EXPECT_NE(nullptr, Monitored_Client::find(3, 2));
}

TEST_F(IPChange, AnAddressOfAnotherInterfaceIsNotKnown) {
  EXPECT_EQ(Hb_Success, added(3, en0, known));
  expect_alias_alone();
}

TEST_F(IPChange, AnAddressOfAnotherNodeIsNotKnown) {
  EXPECT_EQ(Hb_Success, added(2, en1, known));
  expect_alias_alone();
}

TEST_F(IPChange, AnAddressThatGoesWithTheWaitingTableAndComesAgainIsAChange) {
  disappears(3, 1);
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, &global_config_tbl, nullptr));
  EXPECT_EQ(Hb_Success, added(3, en1, known));
  EXPECT_EQ(1U, times_traced(233));
}

// Going.

TEST_F(IPChange, AnAddressThatIsKnownAndGoesIsTakenFromTheTableWithItsDeath) {
  disappears(3, 1);
  EXPECT_EQ(Hb_Success, deleted(3, en1, known));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ("adapters", name());
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 1)));
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
}

TEST_F(IPChange, AnAliasAddressThatGoesIsTheAliasEventAlone) {
  EXPECT_EQ(Hb_Success, deleted(3, en1, alias));
  expect_alias_alone();
}

TEST_F(IPChange, AnAddressThatIsInTheTableInForceAloneAndGoesIsAChange) {
  disappears(3, 1);
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, &global_config_tbl, nullptr));
  EXPECT_EQ(Hb_Success, deleted(3, en1, known));
  EXPECT_EQ(1U, times_traced(233));
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 1)));
}

TEST_F(IPChange, AnAddressThatIsInTheWaitingTableAloneAndGoesIsAChange) {
  const zu_vex_IP_address6_t address = new_boot_address();
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, &global_config_tbl, nullptr));
  EXPECT_EQ(Hb_Success, deleted(3, en1, address));
  EXPECT_EQ(1U, times_traced(233));
}

TEST_F(IPChange, ABootAddressThatHasGoneAndGoesIsRepeated) {
  const zu_vex_IP_address6_t address = new_boot_address();
  EXPECT_EQ(Hb_Success, deleted(3, en1, address));
  expect_empty_event();
}

// Changes and failures.

TEST_F(IPChange, EveryOtherTypeIsAChange) {
  EXPECT_EQ(Hb_Success, take(notification(ZU_EVM_ADDRESS_CHG, 3, en1, known)));
  EXPECT_EQ(128, out.events);
  EXPECT_EQ("Hb_Config_Group", name());
  EXPECT_EQ(Hb_Success, take(notification(static_cast<zu_evm_event_type_t>(77), 3, en1, alias)));
  EXPECT_EQ(2U, times_traced(233));
}

TEST_F(IPChange, WhoseInterfacesCannotBeListedFails) {
  platform_double().net_intf_info.answers.push_back({-1, nullptr});
  EXPECT_EQ(Hb_Failure, take(notification(ZU_EVM_ADDRESS_CHG, 3, en1, known)));
  EXPECT_EQ(65, hb_get_errno());
  EXPECT_TRUE(out.untouched());
  expect_no_rebuild();
}

TEST_F(IPChange, FailsAsTheBuildOfTheTableDoes) {
  platform_double().node_info.answers.push_back({-1, nullptr});
  EXPECT_EQ(Hb_Failure, take(notification(ZU_EVM_ADDRESS_CHG, 3, en1, known)));
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
}

TEST_F(IPChange, KeepsNoneOfTheListsItAskedFor) {
  const size_t before = Scripted_Cluster::outstanding(Platform_Handout::net_intf_info);
  take(notification(ZU_EVM_ADDRESS_CHG, 3, en1, known));
  EXPECT_EQ(before, Scripted_Cluster::outstanding(Platform_Handout::net_intf_info));
}

TEST_F(IPChange, OfNodesBeyondEveryTableIsAnAlias) {
  for (const uint32_t node : {2049U, 65539U, 89478486U, minus_one}) {
    out = EventOutputs();
    EXPECT_EQ(Hb_Success, added(node, en1, known));
    expect_alias_alone();
    EXPECT_EQ(Hb_Success, deleted(node, nullptr, known));
    expect_alias_alone();
  }
}

}  // namespace
}  // namespace hb_test
