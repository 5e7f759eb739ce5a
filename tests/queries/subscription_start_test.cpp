// Functions on subscription groups start the client, or fail as the start does.
#include <gtest/gtest.h>

#include <functional>
#include <ostream>

#include "subscription_record.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

struct Group_Function {
  const char* name;
  std::function<Hb_Rc(Hb_Subscription_Group*)> call;
};

void PrintTo(const Group_Function& function, std::ostream* stream) { *stream << function.name; }

Hb_Adapter_Number adapter_output;
Hb_Node_Number node_output;
Hb_Site_Number site_output;

const Group_Function functions_that_start[] = {
    {"hb_empty_subscription_group", hb_empty_subscription_group},
    {"hb_add_all_adapters_to_subscription_group", hb_add_all_adapters_to_subscription_group},
    {"hb_add_all_nodes_to_subscription_group", hb_add_all_nodes_to_subscription_group},
    {"hb_add_all_sites_to_subscription_group", hb_add_all_sites_to_subscription_group},
    {"hb_add_adapter_to_subscription_group",
     [](auto* group) { return hb_add_adapter_to_subscription_group(group, 13); }},
    {"hb_remove_adapter_from_subscription_group",
     [](auto* group) { return hb_remove_adapter_from_subscription_group(group, 13); }},
    {"hb_add_network_to_subscription_group",
     [](auto* group) { return hb_add_network_to_subscription_group(group, 1); }},
    {"hb_remove_network_from_subscription_group",
     [](auto* group) { return hb_remove_network_from_subscription_group(group, 1); }},
    {"hb_add_node_to_subscription_group", [](auto* group) { return hb_add_node_to_subscription_group(group, 3); }},
    {"hb_remove_node_from_subscription_group",
     [](auto* group) { return hb_remove_node_from_subscription_group(group, 3); }},
    {"hb_add_site_to_subscription_group", [](auto* group) { return hb_add_site_to_subscription_group(group, 1); }},
    {"hb_remove_site_from_subscription_group",
     [](auto* group) { return hb_remove_site_from_subscription_group(group, 1); }},
    {"hb_get_first_subscription_adapter",
     [](auto* group) { return hb_get_first_subscription_adapter(group, &adapter_output); }},
    {"hb_get_next_subscription_adapter",
     [](auto* group) { return hb_get_next_subscription_adapter(group, &adapter_output); }},
    {"hb_get_first_subscription_node", [](auto* group) { return hb_get_first_subscription_node(group, &node_output); }},
    {"hb_get_next_subscription_node", [](auto* group) { return hb_get_next_subscription_node(group, &node_output); }},
    {"hb_get_first_subscription_site", [](auto* group) { return hb_get_first_subscription_site(group, &site_output); }},
    {"hb_get_next_subscription_site", [](auto* group) { return hb_get_next_subscription_site(group, &site_output); }},
};

std::string name_of_function(const testing::TestParamInfo<Group_Function>& test) { return test.param.name; }

class EveryGroupFunction : public testing::TestWithParam<Group_Function> {
 protected:
  // It fails with that error, and neither the group nor an output is written.
  static void expect_start_fails(int error) {
    Hb_Subscription_Group group = group_filled_with(0x3C, 4);
    const Hb_Subscription_Group before = group;
    adapter_output = 77;
    node_output = 77;
    site_output = 77;
    EXPECT_TRUE(fails_with(error, [&] { return GetParam().call(&group); }));
    EXPECT_TRUE(same_bytes(before, group));
    EXPECT_EQ(77U, adapter_output);
    EXPECT_EQ(77, node_output);
    EXPECT_EQ(77, site_output);
  }
};

TEST_P(EveryGroupFunction, FailsAsTheStartDoesWhileNoDaemonIsThere) {
  reset_platform();
  FakeDaemon daemon;
  daemon.stop_listening();
  expect_start_fails(15);
}

TEST_P(EveryGroupFunction, FailsAsTheStartDoesWithoutTheServicesOfVexMode) {
  reset_platform();
  IsVEX = Hb_True;
  expect_start_fails(untouched_error);
  EXPECT_EQ(1, platform_double().boot_addrs.calls);
  IsVEX = Hb_False;
}

TEST_P(EveryGroupFunction, StartsTheClientByItself) {
  reset_platform();
  FakeDaemon daemon;
  daemon.serve_configuration(configuration_answer(sparse_cluster()));
  Hb_Subscription_Group group = group_of_type(4);
  GetParam().call(&group);
  EXPECT_EQ(Hb_True, client_initialized);
  daemon.take_connection();
  hb_terminate();
}

TEST_P(EveryGroupFunction, RefusesANullGroup) {
  load(sparse_cluster());
  EXPECT_TRUE(fails_with(4, [&] { return GetParam().call(nullptr); }));
  unload();
}

INSTANTIATE_TEST_SUITE_P(Subscription, EveryGroupFunction, testing::ValuesIn(functions_that_start), name_of_function);

}  // namespace
}  // namespace hb_test
