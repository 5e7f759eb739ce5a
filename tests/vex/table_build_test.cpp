// Building a configuration table from the cluster services, and what comes of it without them.
#include <algorithm>
#include <array>
#include <tuple>

#include "hb_global_data/record_index.h"
#include "table_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

class TableBuild : public TableState {
 protected:
  Hb_Rc build(Hb_Configuration_Internal* source = nullptr, zu_vex_net_intf_info_t* interfaces = nullptr) {
    return hb_vex_update_global_tbl(&table, nullptr, source, interfaces);
  }
  Hb_Rc build_after(zu_evm_event_category_t category) {
    event.category = category;
    return hb_vex_update_global_tbl(&table, &event, nullptr, nullptr);
  }

  // What was asked of the services, in order.
  static std::vector<std::string> asked() {
    std::vector<std::string> calls;
    for (const Platform_Question& question : scripted_cluster().asked) calls.emplace_back(question.call);
    return calls;
  }

  void mark_table() { std::memset(static_cast<void*>(&table), 0x5A, sizeof table); }
  bool is_table_untouched() {
    const auto* bytes = reinterpret_cast<const unsigned char*>(&table);
    const bool untouched = std::all_of(bytes, bytes + sizeof table, [](unsigned char byte) { return byte == 0x5A; });
    table = {};
    return untouched;
  }

  std::vector<std::tuple<int, int, int>> nodes() const {
    std::vector<std::tuple<int, int, int>> list;
    for (int i = 0; i < table.Hb_num_nodes; ++i) {
      const Hb_Node_config_state& node = table.node_list[i];
      list.emplace_back(node.node_num, node.state, node.reason);
    }
    return list;
  }
  std::vector<uint32_t> adapter_numbers() const {
    std::vector<uint32_t> numbers;
    for (int i = 0; i < table.Hb_num_adapters; ++i) {
      numbers.push_back(table.Hb_global_adapter_list[i].Hb_adapter_num);
    }
    return numbers;
  }

  // One node that is up, and interfaces of these states on it.
  void one_node_with(std::initializer_list<zu_vex_intf_status_t> states) {
    scripted_cluster().nodes = {{.number = 1}};
    uint8_t index = 0;
    for (const zu_vex_intf_status_t state : states) {
      scripted_cluster().interfaces.push_back(interface_of(1, "en" + std::to_string(index), index, state));
      ++index;
    }
  }

  zu_evm_event_metadata_t event = {};
};

// Without services.

TEST_F(TableBuild, WithoutServicesFailsAndLeavesTheTableAlone) {
  scripted_cluster().has_services = false;
  platform_double().errno_after_trace = 5;
  mark_table();
  errno = 77;
  EXPECT_EQ(build(), Hb_Failure);
  EXPECT_EQ(errno, 77);
  EXPECT_EQ(hb_get_errno(), 63);
  EXPECT_TRUE(is_table_untouched());
  EXPECT_THAT(data_lines(36, 2), ElementsAre("Errors 36: [zu_vex_get_cluster_info()] [(Default)] -1 77"));
  ASSERT_THAT(platform_double().traces, SizeIs(1));
  EXPECT_EQ(platform_double().traces[0].blocks[0].size(), 26U);
  EXPECT_EQ(platform_double().traces[0].blocks[1].size(), 10U);
}

TEST_F(TableBuild, WithoutServicesFailsEachTimeAndWithoutTraceAsWell) {
  scripted_cluster().has_services = false;
  trace_nothing();
  for (int i = 0; i < 3; ++i) {
    set_hb_errno(untouched_number);
    errno = 78;
    EXPECT_EQ(build(&global_config_tbl, nullptr), Hb_Failure);
    EXPECT_EQ(errno, 78);
    EXPECT_EQ(hb_get_errno(), 63);
  }
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(TableBuild, WithoutServicesLeavesTheNodesInForce) {
  scripted_cluster().has_services = false;
  global_node_tbl[7] = Hb_True;
  global_num_nodes = 1;
  EXPECT_EQ(build(), Hb_Failure);
  EXPECT_EQ(global_node_tbl[7], Hb_True);
  EXPECT_EQ(global_num_nodes, 1);
}

TEST_F(TableBuild, AClusterThatIsNullIsNone) {
  platform_double().cluster_info.answers.push_back({0, nullptr});
  EXPECT_EQ(build(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 63);
}

// Queries that fail.

TEST_F(TableBuild, AFailedNodeQueryIsNamed) {
  platform_double().node_info.answers.push_back({-5, nullptr, 11});
  mark_table();
  errno = 77;
  EXPECT_EQ(build(), Hb_Failure);
  EXPECT_EQ(errno, 77);
  EXPECT_EQ(hb_get_errno(), 64);
  EXPECT_TRUE(is_table_untouched());
  EXPECT_THAT(data_lines(36, 2), ElementsAre("Errors 36: [zu_vex_get_node_info()] [(Default)] -5 11"));
}

TEST_F(TableBuild, AFailedNodeQueryAfterAnEventIsNamed) {
  platform_double().node_info_after_event.answers.push_back({3, nullptr, 12});
  mark_table();
  errno = 77;
  EXPECT_EQ(build_after(ZU_EVM_EVENT_CATEGORY_NODE_LIST), Hb_Failure);
  EXPECT_EQ(errno, 77);
  EXPECT_EQ(hb_get_errno(), 64);
  EXPECT_TRUE(is_table_untouched());
  EXPECT_THAT(data_lines(36, 2), ElementsAre("Errors 36: [zu_vex_get_node_info_after_event()] [(Default)] 3 12"));
}

TEST_F(TableBuild, AFailedInterfaceQueryIsNamed) {
  scripted_cluster().nodes = {{.number = 1}};
  platform_double().net_intf_info.answers.push_back({-1, nullptr, 13});
  mark_table();
  errno = 77;
  EXPECT_EQ(build(), Hb_Failure);
  EXPECT_EQ(errno, 77);
  EXPECT_EQ(hb_get_errno(), 65);
  EXPECT_TRUE(is_table_untouched());
  EXPECT_THAT(data_lines(36, 2), ElementsAre("Errors 36: [zu_vex_get_net_intf_info()] [(Default)] -1 13"));
}

TEST_F(TableBuild, AFailedInterfaceQueryAfterAnEventIsNamed) {
  platform_double().net_intf_info_after_event.answers.push_back({-16, nullptr, 14});
  mark_table();
  EXPECT_EQ(build_after(ZU_EVM_EVENT_CATEGORY_IP_CHANGE), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 65);
  EXPECT_TRUE(is_table_untouched());
  EXPECT_THAT(data_lines(36, 2), ElementsAre("Errors 36: [zu_vex_get_net_intf_info_after_event()] [(Default)] -16 14"));
}

TEST_F(TableBuild, AFailedQueryFailsWithoutTraceAsWell) {
  trace_nothing();
  platform_double().node_info.answers.push_back({-5, nullptr, 11});
  EXPECT_EQ(build(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 64);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

// Which query is asked.

struct Asked_After {
  zu_evm_event_category_t category;
  const char* nodes;
  const char* interfaces;
};

class TableBuildAfter : public TableBuild, public testing::WithParamInterface<Asked_After> {};

TEST_P(TableBuildAfter, AsksBehindTheEventOfItsKind) {
  EXPECT_EQ(build_after(GetParam().category), Hb_Success);
  EXPECT_THAT(asked(), ElementsAre("zu_vex_get_cluster_info", GetParam().nodes, GetParam().interfaces));
  for (const Platform_Question& question : scripted_cluster().asked) {
    const bool after_event = std::string(question.call).find("_after_event") != std::string::npos;
    EXPECT_EQ(question.has_metadata, after_event);
    EXPECT_EQ(question.category, after_event ? static_cast<int>(GetParam().category) : 0);
  }
}

constexpr const char* nodes_now = "zu_vex_get_node_info";
constexpr const char* nodes_after = "zu_vex_get_node_info_after_event";
constexpr const char* interfaces_now = "zu_vex_get_net_intf_info";
constexpr const char* interfaces_after = "zu_vex_get_net_intf_info_after_event";

INSTANTIATE_TEST_SUITE_P(Categories, TableBuildAfter,
                         testing::Values(Asked_After{ZU_EVM_EVENT_CATEGORY_NODE_LIVENESS, nodes_after, interfaces_now},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_ADAPTER_LIVENESS, nodes_now,
                                                     interfaces_after},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_PROCESS_LIVENESS, nodes_now, interfaces_now},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_NODE_CFG, nodes_now, interfaces_now},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_ADDR_CFG, nodes_now, interfaces_now},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_IP_CHANGE, nodes_now, interfaces_after},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_NODE_LIST, nodes_after, interfaces_now},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_REPOS_DISK, nodes_now, interfaces_now},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_SITE_CFG, nodes_now, interfaces_now},
                                         Asked_After{ZU_EVM_EVENT_CATEGORY_CAP_UP, nodes_now, interfaces_now}));

TEST_F(TableBuild, WithoutAnEventAsksForWhatIsNow) {
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_THAT(asked(), ElementsAre("zu_vex_get_cluster_info", nodes_now, interfaces_now));
}

TEST_F(TableBuild, TakesAListInsteadOfAskingAndLeavesItToItsOwner) {
  scripted_cluster().interfaces = {interface_of(1, "en9", 9)};
  zu_vex_net_intf_info_t* list = callers_list({interface_of(2, "en0", 0)});
  event.category = ZU_EVM_EVENT_CATEGORY_IP_CHANGE;
  EXPECT_EQ(hb_vex_update_global_tbl(&table, &event, nullptr, list), Hb_Success);
  EXPECT_THAT(asked(), ElementsAre("zu_vex_get_cluster_info", nodes_now));
  EXPECT_THAT(adapter_numbers(), ElementsAre(96));
  EXPECT_EQ(list->node_number, 2U);
}

// The table's numbers.

TEST_F(TableBuild, SaysHowLargeAClusterCanBeAndWhichNodeThisIs) {
  scripted_cluster().local_node = 5;
  one_node_with({ZU_VEX_INTF_STATUS_UP});
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.local_node_number, 5);
  EXPECT_EQ(table.Hb_max_nodes, 2049);
  EXPECT_EQ(table.Hb_num_networks, 48);
  EXPECT_EQ(table.Hb_adapters_per_node, 48);
  EXPECT_EQ(table.Hb_num_nodes, 1);
  EXPECT_EQ(table.Hb_num_adapters, 1);
  EXPECT_EQ(hb_get_errno(), untouched_number);
}

TEST_F(TableBuild, KeepsErrno) {
  platform_double().errno_after_trace = 5;
  one_node_with({ZU_VEX_INTF_STATUS_UP});
  errno = 79;
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(errno, 79);
}

TEST_F(TableBuild, NamesAndSizesItsHashTables) {
  one_node_with({ZU_VEX_INTF_STATUS_UP});
  for (uint32_t node = 1; node <= 8; ++node) {
    for (uint8_t index = 0; index < 40; ++index) {
      scripted_cluster().interfaces.push_back(interface_of(node + 1, "en", index));
    }
  }
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_STREQ(table.node_hash->name, "VEX_node list");
  EXPECT_EQ(table.node_hash->size, 4099);  // the first number from 4098 on that no smaller one divides
  EXPECT_STREQ(table.adap_hash->name, "Hb_Adapter list");
  EXPECT_EQ(table.adap_hash->size, 643);  // from 2 x 321 on
  EXPECT_STREQ(table.ip_hash->name, "Hb_IP list");
  EXPECT_EQ(table.ip_hash->size, 643);
}

TEST_F(TableBuild, OfAnEmptyClusterIsEmpty) {
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_num_nodes, 0);
  EXPECT_EQ(table.Hb_num_adapters, 0);
  EXPECT_EQ(by_number(table, 0), nullptr);
  EXPECT_EQ(by_node(table, 0), nullptr);
  EXPECT_THAT(value_lines(146), ElementsAre("Info 146: 0"));
}

TEST_F(TableBuild, KnowsOneNetworkAndLeavesTheOthersEmpty) {
  std::memset(static_cast<void*>(table.Hb_global_network_list), 'x', sizeof table.Hb_global_network_list);
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_STREQ(table.Hb_global_network_list[0].Hb_network_name, "VEX_Network");
  EXPECT_STREQ(table.Hb_global_network_list[0].Hb_network_type, "ether");
  EXPECT_EQ(table.Hb_global_network_list[0].Hb_network_name[69], '\0');
  EXPECT_EQ(table.Hb_global_network_list[0].Hb_network_type[15], '\0');
  for (int i = 1; i < 48; ++i) {
    EXPECT_STREQ(table.Hb_global_network_list[i].Hb_network_name, "");
    EXPECT_STREQ(table.Hb_global_network_list[i].Hb_network_type, "");
  }
}

// Nodes.

TEST_F(TableBuild, KeepsTheOrderOfNodesAndFindsThemByNumber) {
  scripted_cluster().nodes = {{.number = 9}, {.number = 2}, {.number = 2048}, {.number = 0}};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_THAT(nodes(),
              ElementsAre(std::tuple(9, 1, 1), std::tuple(2, 1, 1), std::tuple(2048, 1, 1), std::tuple(0, 1, 1)));
  for (int i = 0; i < 4; ++i) {
    const Hb_Node_config_state& node = table.node_list[i];
    EXPECT_EQ(by_node(table, static_cast<uint32_t>(node.node_num)), &node);
  }
}

TEST_F(TableBuild, MarksTheConfiguredNodesAnew) {
  global_node_tbl[7] = Hb_True;
  global_num_nodes = 99;
  scripted_cluster().nodes = {{.number = 0}, {.number = 2048, .status = ZU_VEX_NODE_STATUS_DOWN}};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(global_num_nodes, 2);
  EXPECT_EQ(global_node_tbl[0], Hb_True);
  EXPECT_EQ(global_node_tbl[2048], Hb_True);
  EXPECT_EQ(std::count(std::begin(global_node_tbl), std::end(global_node_tbl), Hb_True), 2);
}

struct Node_Answer {
  zu_vex_node_status_t status;
  zu_vex_node_down_reason_t reason;
  int expected_state;
  int expected_reason;
};

class TableBuildNode : public TableBuild, public testing::WithParamInterface<Node_Answer> {};

TEST_P(TableBuildNode, HasTheStateAndReasonOfTheServices) {
  scripted_cluster().nodes = {{.number = 3, .status = GetParam().status, .reason = GetParam().reason}};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_THAT(nodes(), ElementsAre(std::tuple(3, GetParam().expected_state, GetParam().expected_reason)));
}

constexpr auto up = ZU_VEX_NODE_STATUS_UP;
constexpr auto down = ZU_VEX_NODE_STATUS_DOWN;

INSTANTIATE_TEST_SUITE_P(Reasons, TableBuildNode,
                         testing::Values(Node_Answer{up, ZU_VEX_NODE_DOWN_REASON_NONE, 1, 1},
                                         Node_Answer{up, ZU_VEX_NODE_DOWN_REASON_SHUTDOWN, 1, 1},
                                         Node_Answer{down, ZU_VEX_NODE_DOWN_REASON_NONE, 2, 0},
                                         Node_Answer{down, ZU_VEX_NODE_DOWN_REASON_LINK_DOWN, 2, 6},
                                         Node_Answer{down, ZU_VEX_NODE_DOWN_REASON_SHUTDOWN, 2, 7},
                                         Node_Answer{down, ZU_VEX_NODE_DOWN_REASON_STOPPED, 2, 9},
                                         Node_Answer{down, ZU_VEX_NODE_DOWN_REASON_FORCE_DOWN, 2, 8},
                                         Node_Answer{down, static_cast<zu_vex_node_down_reason_t>(77), 2, 0},
                                         Node_Answer{ZU_VEX_NODE_STATUS_UNDEF, ZU_VEX_NODE_DOWN_REASON_LINK_DOWN, 2, 6},
                                         Node_Answer{static_cast<zu_vex_node_status_t>(2), ZU_VEX_NODE_DOWN_REASON_NONE,
                                                     2, 0}));

class TableBuildHeldNode : public TableBuild, public testing::WithParamInterface<Node_Answer> {};

TEST_P(TableBuildHeldNode, TakenDownWithItsDaemonStaysDown) {
  fill_table(global_config_tbl, 2049, 48, {{3, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down}}, {});
  scripted_cluster().nodes = {{.number = 3, .status = GetParam().status, .reason = GetParam().reason}};
  EXPECT_EQ(build(&global_config_tbl), Hb_Success);
  EXPECT_THAT(nodes(), ElementsAre(std::tuple(3, GetParam().expected_state, GetParam().expected_reason)));
  EXPECT_THAT(platform_double().assertions, IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(Answers, TableBuildHeldNode,
                         testing::Values(Node_Answer{up, ZU_VEX_NODE_DOWN_REASON_NONE, 2, 2},
                                         Node_Answer{ZU_VEX_NODE_STATUS_UNDEF, ZU_VEX_NODE_DOWN_REASON_NONE, 2, 2},
                                         Node_Answer{down, ZU_VEX_NODE_DOWN_REASON_LINK_DOWN, 2, 0}));

TEST_F(TableBuild, ANodeInAnyOtherStateOfTheSourceFollowsTheServices) {
  fill_table(global_config_tbl, 2049, 48,
             {{3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down},
              {4, Hb_Entity_Up, Hb_Entity_State_Reason_BRIXD_Down},
              {5, Hb_Entity_Up, Hb_Entity_State_Reason_BRIXD_Up}},
             {});
  scripted_cluster().nodes = {{.number = 3}, {.number = 4}, {.number = 5}, {.number = 6}};
  EXPECT_EQ(build(&global_config_tbl), Hb_Success);
  EXPECT_THAT(nodes(), ElementsAre(std::tuple(3, 1, 1), std::tuple(4, 1, 1), std::tuple(5, 1, 1), std::tuple(6, 1, 1)));
}

TEST_F(TableBuild, TakesTheFirst2049Nodes) {
  for (uint32_t i = 0; i < 2060; ++i) scripted_cluster().nodes.push_back({.number = i < 2049 ? 2048 - i : i - 2049});
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_num_nodes, 2049);
  EXPECT_EQ(global_num_nodes, 2049);
  EXPECT_EQ(table.node_list[2048].node_num, 0);
}

TEST_F(TableBuild, LeavesOutNodesAndInterfacesThatNoTableHasAPlaceFor) {
  scripted_cluster().nodes = {{.number = 2049}, {.number = 1}, {.number = 0xFFFFFFFF}, {.number = 65537}};
  scripted_cluster().interfaces = {interface_of(2049, "en0", 0), interface_of(1, "en1", 1),
                                   interface_of(0xFFFFFFFF, "en2", 2), interface_of(89478486, "en3", 3)};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_THAT(nodes(), ElementsAre(std::tuple(1, 1, 1)));
  EXPECT_THAT(adapter_numbers(), ElementsAre(48));
}

// Adapters.

// Lists whose last record leads back to the first.

TEST_F(TableBuild, OfAnEndlessListOfNodesTakesWhatATableHolds) {
  zu_vex_node_info_t nodes_of_list[2] = {};
  nodes_of_list[0].number = 4;
  nodes_of_list[1].number = 5;
  nodes_of_list[0].p_next = &nodes_of_list[1];
  nodes_of_list[1].p_next = &nodes_of_list[0];
  platform_double().node_info.answers.push_back({0, nodes_of_list});
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_num_nodes, 2049);
  scripted_cluster().reset();  // which has counted that it got such a list back
}

TEST_F(TableBuild, OfAnEndlessListOfNodesThatNoTableHasAPlaceForTakesNone) {
  zu_vex_node_info_t node = {};
  node.number = 2049;
  node.p_next = &node;
  platform_double().node_info.answers.push_back({0, &node});
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_num_nodes, 0);
  scripted_cluster().reset();
}

TEST_F(TableBuild, OfAnEndlessListOfInterfacesTakesWhatATableHolds) {
  trace_nothing();
  zu_vex_net_intf_info_t interfaces[2] = {};
  interfaces[0].node_number = 1;
  interfaces[0].ip_addr = scripted_address(1, 1, 0);
  interfaces[1].node_number = 2049;
  interfaces[0].p_next = &interfaces[1];
  interfaces[1].p_next = &interfaces[0];
  EXPECT_EQ(build(nullptr, interfaces), Hb_Success);
  EXPECT_EQ(table.Hb_num_adapters, 48);
}

TEST_F(TableBuild, OfANameWithoutAnEnd35CharactersAreRead) {
  const std::unique_ptr<char[]> name(new char[35]);
  std::memset(name.get(), 'x', 35);
  zu_vex_net_intf_info_t interface = {};
  interface.node_number = 1;
  interface.p_name = name.get();
  EXPECT_EQ(build(nullptr, &interface), Hb_Success);
  ASSERT_EQ(table.Hb_num_adapters, 1);
  EXPECT_EQ(std::string(table.Hb_global_adapter_list[0].Hb_adapter_type), std::string(35, 'x'));
}

TEST_F(TableBuild, NumbersTheAdaptersOfEachNodeInTheOrderOfTheList) {
  scripted_cluster().nodes = {{.number = 1}, {.number = 2}};
  scripted_cluster().interfaces = {interface_of(2, "en0", 0),    interface_of(1, "en0", 1), interface_of(2, "en1", 2),
                                   interface_of(2048, "en0", 3), interface_of(1, "en1", 4), interface_of(0, "lo", 5)};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_THAT(adapter_numbers(), ElementsAre(96, 48, 97, 98304, 49, 0));
  for (int i = 0; i < 6; ++i) {
    Hb_Adapter& adapter = table.Hb_global_adapter_list[i];
    EXPECT_EQ(by_number(table, adapter.Hb_adapter_num), &adapter);
    EXPECT_EQ(by_address(table, scripted_cluster().interfaces[static_cast<size_t>(i)].address), &adapter);
    EXPECT_EQ(adapter.Hb_network, 0);
  }
  EXPECT_STREQ(table.Hb_global_adapter_list[2].Hb_adapter_type, "en1");
  EXPECT_TRUE(has_address(table.Hb_global_adapter_list[2], scripted_address(1, 2, 2)));
}

TEST_F(TableBuild, DropsTheAddressesOfANodeBeyond48) {
  for (uint8_t index = 0; index < 50; ++index) scripted_cluster().interfaces.push_back(interface_of(1, "en", index));
  scripted_cluster().interfaces.push_back(interface_of(2, "en", 0));
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_num_adapters, 49);
  EXPECT_EQ(table.Hb_global_adapter_list[47].Hb_adapter_num, 95U);
  EXPECT_EQ(table.Hb_global_adapter_list[48].Hb_adapter_num, 96U);
  EXPECT_EQ(by_address(table, scripted_address(1, 1, 48)), nullptr);
  EXPECT_THAT(value_lines(146), ElementsAre("Info 146: 49"));
  EXPECT_EQ(hb_get_errno(), untouched_number);
}

TEST_F(TableBuild, HoldsTheLargestCluster) {
  for (uint32_t node = 0; node < 2049; ++node) {
    scripted_cluster().nodes.push_back({.number = node});
    for (uint8_t index = 0; index < 48; ++index) {
      scripted_cluster().interfaces.push_back(
          {.node = node,
           .name = "en",
           .address = scripted_address(static_cast<uint8_t>(node >> 8U), static_cast<uint8_t>(node), index)});
    }
  }
  trace_nothing();
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_num_nodes, 2049);
  EXPECT_EQ(table.Hb_num_adapters, 98352);
  EXPECT_EQ(by_address(table, scripted_address(8, 0, 47))->Hb_adapter_num, 98351U);
}

TEST_F(TableBuild, CutsANameBehind35Characters) {
  const std::string name = "0123456789012345678901234567890123456789";
  scripted_cluster().interfaces = {interface_of(1, name, 0), interface_of(1, name.substr(0, 35), 1)};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(std::string(table.Hb_global_adapter_list[0].Hb_adapter_type), name.substr(0, 35));
  EXPECT_EQ(std::string(table.Hb_global_adapter_list[1].Hb_adapter_type), name.substr(0, 35));
}

TEST_F(TableBuild, AnInterfaceWithoutANameHasAnEmptyOne) {
  scripted_cluster().interfaces = {{.node = 1, .name = std::nullopt}};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_STREQ(table.Hb_global_adapter_list[0].Hb_adapter_type, "");
}

TEST_F(TableBuild, AnAddressThatComesTwiceLeadsToItsLastAdapter) {
  scripted_cluster().interfaces = {interface_of(1, "en0", 0), interface_of(1, "en1", 0)};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_num_adapters, 2);
  EXPECT_EQ(by_address(table, scripted_address(1, 1, 0)), &table.Hb_global_adapter_list[1]);
}

TEST_F(TableBuild, TracesEachInsertionWithTheAddress) {
  scripted_cluster().interfaces = {interface_of(1, "en0", 7)};
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_THAT(data_lines(147, 1), ElementsAre("Debug 147: [10.1.1.7] 48"));
  EXPECT_THAT(data_lines(148, 1), ElementsAre("Debug 148: [10.1.1.7] 48"));
}

// States of adapters.

TEST_F(TableBuild, AnAdapterIsUpOrDownAsItsInterface) {
  one_node_with({ZU_VEX_INTF_STATUS_UP, ZU_VEX_INTF_STATUS_DOWN});
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_global_adapter_list[0].Hb_state, Hb_Entity_Up);
  EXPECT_EQ(table.Hb_global_adapter_list[1].Hb_state, Hb_Entity_Down);
  EXPECT_EQ(hb_get_errno(), untouched_number);
}

class TableBuildOddState : public TableBuild, public testing::WithParamInterface<int> {};

TEST_P(TableBuildOddState, IsUndefinedAndDoesNotStopTheBuild) {
  one_node_with({static_cast<zu_vex_intf_status_t>(GetParam()), ZU_VEX_INTF_STATUS_UP});
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(hb_get_errno(), 71);
  EXPECT_EQ(table.Hb_global_adapter_list[0].Hb_state, Hb_Entity_Undef);
  EXPECT_EQ(table.Hb_global_adapter_list[1].Hb_state, Hb_Entity_Up);
}

INSTANTIATE_TEST_SUITE_P(States, TableBuildOddState, testing::Values(-1, 3, 99, -2147483647));

TEST_F(TableBuild, AStaleInterfaceIsDownWithoutASource) {
  one_node_with({ZU_VEX_INTF_STATUS_STALE});
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_global_adapter_list[0].Hb_state, Hb_Entity_Down);
  EXPECT_EQ(hb_get_errno(), untouched_number);
}

TEST_F(TableBuild, AStaleInterfaceKeepsTheStateThatItsAddressHad) {
  fill_table(global_config_tbl, 2049, 48, {},
             {{1, Hb_Entity_Up, "other", scripted_address(1, 1, 0)},
              {2, Hb_Entity_Down, "en1", scripted_address(1, 1, 1)},
              {3, Hb_Entity_Undef, "en2", scripted_address(1, 1, 2)}});
  one_node_with({ZU_VEX_INTF_STATUS_STALE, ZU_VEX_INTF_STATUS_STALE, ZU_VEX_INTF_STATUS_STALE});
  EXPECT_EQ(build(&global_config_tbl), Hb_Success);
  EXPECT_EQ(table.Hb_global_adapter_list[0].Hb_state, Hb_Entity_Up);
  EXPECT_EQ(table.Hb_global_adapter_list[1].Hb_state, Hb_Entity_Down);
  EXPECT_EQ(table.Hb_global_adapter_list[2].Hb_state, Hb_Entity_Undef);
  EXPECT_EQ(hb_get_errno(), untouched_number);
  EXPECT_THAT(platform_double().assertions, IsEmpty());
}

TEST_F(TableBuild, AStaleInterfaceThatTheSourceDoesNotKnowIsUndefined) {
  fill_table(global_config_tbl, 2049, 48, {}, {{1, Hb_Entity_Up, "en0", scripted_address(1, 1, 9)}});
  one_node_with({ZU_VEX_INTF_STATUS_STALE, ZU_VEX_INTF_STATUS_DOWN});
  EXPECT_EQ(build(&global_config_tbl), Hb_Success);
  EXPECT_EQ(table.Hb_global_adapter_list[0].Hb_state, Hb_Entity_Undef);
  EXPECT_EQ(table.Hb_global_adapter_list[1].Hb_state, Hb_Entity_Down);
  EXPECT_EQ(hb_get_errno(), 71);
}

// Tables that hold something already.

TEST_F(TableBuild, ReplacesWhatTheTableHeld) {
  one_node_with({ZU_VEX_INTF_STATUS_UP});
  const long before = live_allocations();
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(build(), Hb_Success);
  EXPECT_EQ(table.Hb_num_adapters, 1);
  EXPECT_EQ(table.Hb_num_nodes, 1);
  empty_global_config_table(&table);
  platform_double().traces.clear();
  platform_double().traces.shrink_to_fit();
  EXPECT_EQ(live_allocations(), before);
}

TEST_F(TableBuild, MayHaveItsOwnTableAsTheSource) {
  one_node_with({ZU_VEX_INTF_STATUS_UP});
  EXPECT_EQ(build(), Hb_Success);
  scripted_cluster().interfaces[0].status = ZU_VEX_INTF_STATUS_STALE;
  EXPECT_EQ(build(&table), Hb_Success);
  EXPECT_EQ(table.Hb_global_adapter_list[0].Hb_state, Hb_Entity_Up);
}

TEST_F(TableBuild, OfTheTableInForceIsFoundByTheQueries) {
  one_node_with({ZU_VEX_INTF_STATUS_UP});
  EXPECT_EQ(hb_vex_update_global_tbl(&global_config_tbl, nullptr, nullptr, nullptr), Hb_Success);
  EXPECT_EQ(find_configured_adapter(48), &global_config_tbl.Hb_global_adapter_list[0]);
  EXPECT_EQ(find_configured_node(1), &global_config_tbl.node_list[0]);
  scripted_cluster().interfaces = {interface_of(2, "en0", 0)};
  scripted_cluster().nodes = {{.number = 2}};
  EXPECT_EQ(hb_vex_update_global_tbl(&global_config_tbl, nullptr, nullptr, nullptr), Hb_Success);
  EXPECT_EQ(find_configured_adapter(48), nullptr);
  EXPECT_EQ(find_configured_adapter(96), &global_config_tbl.Hb_global_adapter_list[0]);
  EXPECT_EQ(find_configured_node(1), nullptr);
  EXPECT_EQ(find_configured_node(2), &global_config_tbl.node_list[0]);
}

// Memory.

TEST_F(TableBuild, WithoutMemoryFailsAndChangesNothing) {
  one_node_with({ZU_VEX_INTF_STATUS_UP, ZU_VEX_INTF_STATUS_DOWN});
  trace_nothing();
  EXPECT_EQ(build(), Hb_Success);
  const Hb_Adapter* adapters = table.Hb_global_adapter_list;
  size_t failures = 0;
  for (size_t nth = 1;; ++nth) {
    set_hb_errno(untouched_number);
    errno = 80;
    const AllocationFailure failure(nth);
    const Hb_Rc rc = build();
    if (!failure.happened()) break;
    ++failures;
    EXPECT_EQ(rc, Hb_Failure) << nth;
    EXPECT_EQ(hb_get_errno(), 63) << nth;
    EXPECT_EQ(errno, 80) << nth;
    EXPECT_EQ(table.Hb_global_adapter_list, adapters) << nth;
    EXPECT_EQ(by_number(table, 48), adapters) << nth;
    EXPECT_EQ(Scripted_Cluster::outstanding(), 0U) << nth;
  }
  EXPECT_GE(failures, 8U);  // adapters, nodes and for each of three tables its record, its name and its buckets
}

TEST_F(TableBuild, WithoutMemoryNamesWhereTheInterfacesCameFrom) {
  one_node_with({});
  zu_vex_net_intf_info_t* list = callers_list({interface_of(2, "en0", 0)});
  {
    const AllocationFailure failure(1);
    EXPECT_EQ(build(nullptr, list), Hb_Failure);
  }
  EXPECT_THAT(data_lines(36, 2), ElementsAre("Errors 36: [p_src_intf_tbl] [(Default)] -1 12"));
}

}  // namespace
}  // namespace hb_test
