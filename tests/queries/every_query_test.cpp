// What all queries have in common: starting the client, null outputs, trace and mode, and that they only read.
#include <gmock/gmock.h>

#include <cstring>
#include <functional>
#include <ostream>

#include "configuration_queries.h"
#include "hostile_input.h"
#include "support/running_client.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::Each;
using testing::IsEmpty;

// Room for any output, filled with a pattern that no query writes.
struct Outputs {
  Outputs() { std::memset(bytes, 0xB7, sizeof bytes); }
  template <typename T>
  T* as() {
    return reinterpret_cast<T*>(bytes);
  }
  bool untouched() const {
    for (const uint8_t byte : bytes) {
      if (byte != 0xB7) return false;
    }
    return true;
  }
  alignas(16) uint8_t bytes[128];
};

struct Query {
  const char* name;
  // Null: the call with a null output.
  std::function<Hb_Rc(Outputs*)> call;
};

void PrintTo(const Query& query, std::ostream* stream) { *stream << query.name; }

template <typename T>
T* output(Outputs* outputs) {
  return outputs == nullptr ? nullptr : outputs->as<T>();
}

Hb_Cursor query_cursor = 0;
char network_name[] = "net_disk_01";

const Query queries[] = {
    {"hb_get_number_of_configured_nodes",
     [](Outputs* out) { return hb_get_number_of_configured_nodes(output<int>(out)); }},
    {"hb_get_number_of_configured_adapters",
     [](Outputs* out) { return hb_get_number_of_configured_adapters(output<int>(out)); }},
    {"hb_get_number_of_configured_networks",
     [](Outputs* out) { return hb_get_number_of_configured_networks(output<int>(out)); }},
    {"hb_get_number_of_configured_sites",
     [](Outputs* out) { return hb_get_number_of_configured_sites(output<int>(out)); }},
    {"hb_get_my_node_number", [](Outputs* out) { return hb_get_my_node_number(output<Hb_Node_Number>(out)); }},
    {"hb_get_adapter_number_by_node_number",
     [](Outputs* out) { return hb_get_adapter_number_by_node_number(4, 1, output<Hb_Adapter_Number>(out)); }},
    {"hb_get_node_number_by_adapter_number",
     [](Outputs* out) { return hb_get_node_number_by_adapter_number(17, output<Hb_Node_Number>(out)); }},
    {"hb_get_number_of_configured_adapters_in_node",
     [](Outputs* out) { return hb_get_number_of_configured_adapters_in_node(4, output<int>(out)); }},
    {"hb_get_adapter_number_by_address",
     [](Outputs* out) {
       return hb_get_adapter_number_by_address(address_of("10.0.0.3"), output<Hb_Adapter_Number>(out));
     }},
    {"hb_get_adapter_address_by_number",
     [](Outputs* out) { return hb_get_adapter_address_by_number(13, output<Hb_IP_address6>(out)); }},
    {"hb_get_adapter_type_by_number",
     [](Outputs* out) { return hb_get_adapter_type_by_number(13, output<char>(out)); }},
    {"hb_get_network_number_by_name",
     [](Outputs* out) { return hb_get_network_number_by_name(network_name, output<Hb_Network_Number>(out)); }},
    {"hb_get_network_name_by_number", [](Outputs* out) { return hb_get_network_name_by_number(3, output<char>(out)); }},
    {"hb_get_network_type_by_number", [](Outputs* out) { return hb_get_network_type_by_number(3, output<char>(out)); }},
    {"hb_get_first_configured_node_number",
     [](Outputs* out) { return hb_get_first_configured_node_number(output<Hb_Node_Number>(out), &query_cursor); }},
    {"hb_get_next_configured_node_number",
     [](Outputs* out) { return hb_get_next_configured_node_number(output<Hb_Node_Number>(out), &query_cursor); }},
    {"hb_get_first_configured_adapter_number",
     [](Outputs* out) {
       return hb_get_first_configured_adapter_number(output<Hb_Adapter_Number>(out), &query_cursor);
     }},
    {"hb_get_next_configured_adapter_number",
     [](Outputs* out) { return hb_get_next_configured_adapter_number(output<Hb_Adapter_Number>(out), &query_cursor); }},
    {"hb_get_first_configured_adapter_in_node",
     [](Outputs* out) {
       return hb_get_first_configured_adapter_in_node(0, output<Hb_Adapter_Number>(out), &query_cursor);
     }},
    {"hb_get_next_configured_adapter_in_node",
     [](Outputs* out) {
       return hb_get_next_configured_adapter_in_node(0, output<Hb_Adapter_Number>(out), &query_cursor);
     }},
    {"hb_get_first_configured_network_number",
     [](Outputs* out) {
       return hb_get_first_configured_network_number(output<Hb_Network_Number>(out), &query_cursor);
     }},
    {"hb_get_next_configured_network_number",
     [](Outputs* out) { return hb_get_next_configured_network_number(output<Hb_Network_Number>(out), &query_cursor); }},
    {"hb_get_first_configured_adapter_in_network",
     [](Outputs* out) {
       return hb_get_first_configured_adapter_in_network(0, output<Hb_Adapter_Number>(out), &query_cursor);
     }},
    {"hb_get_next_configured_adapter_in_network",
     [](Outputs* out) {
       return hb_get_next_configured_adapter_in_network(0, output<Hb_Adapter_Number>(out), &query_cursor);
     }},
    {"hb_get_first_configured_site_number",
     [](Outputs* out) { return hb_get_first_configured_site_number(output<Hb_Site_Number>(out), &query_cursor); }},
    {"hb_get_next_configured_site_number",
     [](Outputs* out) { return hb_get_next_configured_site_number(output<Hb_Site_Number>(out), &query_cursor); }},
};

std::string name_of_query(const testing::TestParamInfo<Query>& test) { return test.param.name; }

// Whether the query is one of the two on sites, which never succeed in the sparse cluster.
bool walks_sites(const Query& query) { return std::strstr(query.name, "configured_site_number") != nullptr; }

// The state, the hash tables of the configuration, and the sites.
Bytes image_of_configuration() {
  return image_of_state() + image_of(global_config_tbl.adap_hash) + image_of(global_config_tbl.ip_hash) +
         image_of(global_config_tbl.node_hash) + image_of(global_site_tbl, HB_MAX_SITES) + image_of(&global_num_sites);
}

class EveryQuery : public testing::TestWithParam<Query> {
 protected:
  EveryQuery() {
    forget_leftovers();
    query_cursor = 0;
  }
};

TEST_P(EveryQuery, FailsAsTheStartDoesWhileNoDaemonIsThere) {
  reset_platform();
  FakeDaemon daemon;
  daemon.stop_listening();
  Outputs outputs;
  EXPECT_TRUE(fails_with(15, [&] { return GetParam().call(&outputs); }));
  EXPECT_TRUE(outputs.untouched());
  EXPECT_EQ(0, query_cursor);
}

TEST_P(EveryQuery, FailsInVexModeWithoutClusterServicesAndSetsNoErrorNumber) {
  reset_platform();
  IsVEX = Hb_True;
  query_cursor = 55;
  Outputs outputs;
  SystemCalls calls;
  EXPECT_TRUE(fails_without_error_number([&] { return GetParam().call(&outputs); }));
  EXPECT_TRUE(calls.of("socket").empty());
  EXPECT_TRUE(outputs.untouched());
  EXPECT_EQ(55, query_cursor);
  IsVEX = Hb_False;
}

TEST_P(EveryQuery, RefusesANullOutput) {
  load(sparse_cluster());
  EXPECT_TRUE(fails_with(4, [&] { return GetParam().call(nullptr); }));
  EXPECT_EQ(0, query_cursor);
  unload();
}

TEST_P(EveryQuery, StartsTheClientByItself) {
  reset_platform();
  FakeDaemon daemon;
  daemon.serve_configuration(configuration_answer(sparse_cluster()));
  Outputs outputs;
  EXPECT_EQ(walks_sites(GetParam()) ? Hb_Failure : Hb_Success, GetParam().call(&outputs));
  EXPECT_EQ(Hb_True, client_initialized);
  EXPECT_FALSE(outputs.untouched());
  daemon.take_connection();
  hb_terminate();
}

TEST_P(EveryQuery, ChangesNothingInTheConfiguration) {
  load(sparse_cluster());
  const Bytes before = image_of_configuration();
  Outputs outputs;
  GetParam().call(&outputs);
  EXPECT_TRUE(before == image_of_configuration());
  unload();
}

TEST_P(EveryQuery, TakesNoLock) {
  load(sparse_cluster());
  Outputs outputs;
  SystemCalls calls;
  GetParam().call(&outputs);
  EXPECT_TRUE(calls.of("pthread_mutex_lock").empty());
  EXPECT_TRUE(calls.of("semop").empty());
  unload();
}

TEST_P(EveryQuery, TracesNothingBelowTheInfoCategory) {
  load(sparse_cluster());
  Outputs outputs;
  trace_only(trace_errors);
  GetParam().call(&outputs);
  trace_only(trace_debug);
  GetParam().call(&outputs);
  EXPECT_THAT(platform_double().traces, IsEmpty());
  trace_nothing();
  unload();
}

TEST_P(EveryQuery, AnswersTheSameInVexModeOnceTheTableIsThere) {
  load(sparse_cluster());
  Outputs in_daemon_mode;
  const Hb_Rc result = GetParam().call(&in_daemon_mode);
  query_cursor = 0;
  IsVEX = Hb_True;
  Outputs in_vex_mode;
  EXPECT_EQ(result, GetParam().call(&in_vex_mode));
  EXPECT_EQ(0, std::memcmp(in_daemon_mode.bytes, in_vex_mode.bytes, sizeof in_daemon_mode.bytes));
  IsVEX = Hb_False;
  unload();
}

INSTANTIATE_TEST_SUITE_P(ConfigurationQueries, EveryQuery, testing::ValuesIn(queries), name_of_query);

class UntracedQuery : public EveryQuery {};

TEST_P(UntracedQuery, TracesNothingAtAll) {
  load(sparse_cluster());
  trace_all();
  Outputs outputs;
  for (const Hb_Cursor cursor : {0, 98352}) {  // the second one is the end of each walk
    query_cursor = cursor;
    GetParam().call(&outputs);
  }
  EXPECT_THAT(platform_double().traces, IsEmpty());
  trace_nothing();
  unload();
}

std::vector<Query> untraced_queries() {
  std::vector<Query> untraced;
  for (const Query& query : queries) {
    const std::string name = query.name;
    if (name != "hb_get_node_number_by_adapter_number" && name != "hb_get_adapter_address_by_number" &&
        name != "hb_get_adapter_type_by_number") {
      untraced.push_back(query);
    }
  }
  return untraced;
}

INSTANTIATE_TEST_SUITE_P(ConfigurationQueries, UntracedQuery, testing::ValuesIn(untraced_queries()), name_of_query);

TEST_F(ConfigurationQueries, AFailureTracesNothing) {
  trace_all();
  int count;
  Hb_Node_Number node;
  Hb_Adapter_Number adapter;
  Hb_Network_Number network;
  Hb_IP_address6 address;
  char text[70];
  char unknown_name[] = "net_disk_02";
  std::vector<Hb_Rc> results;
  for (const Hb_Adapter_Number unknown : {31U, 32U}) {
    results.push_back(hb_get_node_number_by_adapter_number(unknown, &node));
    results.push_back(hb_get_adapter_address_by_number(unknown, &address));
    results.push_back(hb_get_adapter_type_by_number(unknown, text));
  }
  for (const Hb_Node_Number unknown : std::initializer_list<Hb_Node_Number>{1, 8}) {
    results.push_back(hb_get_adapter_number_by_node_number(unknown, 0, &adapter));
    results.push_back(hb_get_number_of_configured_adapters_in_node(unknown, &count));
    results.push_back(hb_get_first_configured_adapter_in_node(unknown, &adapter, &query_cursor));
    results.push_back(hb_get_next_configured_adapter_in_node(unknown, &adapter, &query_cursor));
  }
  for (const Hb_Network_Number unknown : std::initializer_list<Hb_Network_Number>{2, 4}) {
    results.push_back(hb_get_network_name_by_number(unknown, text));
    results.push_back(hb_get_first_configured_adapter_in_network(unknown, &adapter, &query_cursor));
    results.push_back(hb_get_next_configured_adapter_in_network(unknown, &adapter, &query_cursor));
  }
  results.push_back(hb_get_network_type_by_number(4, text));
  results.push_back(hb_get_adapter_number_by_address(address_of("10.0.0.4"), &adapter));
  results.push_back(hb_get_network_number_by_name(unknown_name, &network));
  EXPECT_THAT(results, Each(Hb_Failure));
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(ConfigurationQueries, ANullNameIsRefused) {
  Hb_Network_Number network = 99;
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_network_number_by_name(nullptr, &network); }));
}

class ConfigurationOverTheSocket : public RunningClient {
 protected:
  ConfigurationOverTheSocket() : RunningClient(sparse_cluster()) {}
};

TEST_F(ConfigurationOverTheSocket, IsWhatTheQueriesAnswerFrom) {
  int count = 0;
  EXPECT_EQ(Hb_Success, hb_get_number_of_configured_nodes(&count));
  EXPECT_EQ(3, count);
  Hb_Adapter_Number adapter = 99;
  EXPECT_EQ(Hb_Success, hb_get_adapter_number_by_address(address_of("10.0.1.4"), &adapter));
  EXPECT_EQ(17U, adapter);
  char name[70];
  EXPECT_EQ(Hb_Success, hb_get_network_name_by_number(3, name));
  EXPECT_STREQ("net_disk_01", name);
  EXPECT_FALSE(connection.has_input());
}

TEST_F(ConfigurationOverTheSocket, IsGoneAfterTheStop) {
  ASSERT_EQ(Hb_Success, hb_terminate());
  daemon.stop_listening();
  int count = 99;
  EXPECT_TRUE(fails_with(15, [&] { return hb_get_number_of_configured_adapters(&count); }));
  EXPECT_EQ(99, count);
}

}  // namespace
}  // namespace hb_test
