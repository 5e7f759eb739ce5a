// Arguments that are refused are looked at by a client that runs only: the start comes first, and its failure counts.
#include <gtest/gtest.h>

#include <functional>
#include <ostream>

#include "control_operations.h"

namespace hb_test {
namespace {

struct Refused_Call {
  const char* name;
  std::function<Hb_Rc()> call;
  int error;  // of a client that runs; 0 when it does not mind
};

void PrintTo(const Refused_Call& refused, std::ostream* stream) { *stream << refused.name; }

std::vector<Refused_Call> refused_calls() {
  static char interface[] = "en0";
  static char text[] = "text";
  static iovec buffer = {text, 4};
  static auto& out = operation_outputs.bytes;
  static auto& nodes = operation_outputs.nodes;
  return {
      {"AdapterBeyondTheCluster", [] { return hb_enable_adapter(0xFFFFFFFFU); }, 4},
      {"SwapWithNobody",
       [] {
         return hb_swap_adapters(0xFFFFFFFFU, ipv4({9, 9, 9, 9}));
       },
       7},
      {"NoPlaceForAState", [] { return hb_get_adapter_state(13, nullptr); }, 4},
      {"ReportOfAnAdapterBeyondTheCluster", [] { return hb_adapter_is_down(0xFFFFFFFFU); }, 4},
      {"ReportOfANodeBeyondTheCluster", [] { return hb_node_is_down(-1); }, 4},
      {"NoSuchControl", [] { return hb_nim_manual_start_control(static_cast<Hb_nim_manctrl>(3), interface); }, 4},
      {"NoInterface", [] { return hb_nim_manual_start_control(HB_NIM_MANCTRL_ENABLE, nullptr); }, 4},
      {"NoPlaceForPeriods", [] { return hb_get_local_rem_sim_node_down_period(nullptr, nullptr); }, 0},
      {"RouteToANodeBeyondTheCluster", [] { return hb_get_route(-1, &out.route, &out.length); }, 4},
      {"NoPlaceForARoute", [] { return hb_get_route(4, nullptr, nullptr); }, 4},
      {"PublishedRouteToANodeBeyondTheCluster", [] { return hb_read_route(-1, &out.route, &out.length); }, 4},
      {"NoPlaceForAPublishedRoute", [] { return hb_read_route(4, nullptr, nullptr); }, 4},
      {"IpRouteToANodeBeyondTheCluster", [] { return hb_read_ip_route(-1, &out.route, &out.length); }, 4},
      {"NoPlaceForAnIpRoute", [] { return hb_read_ip_route(4, nullptr, nullptr); }, 4},
      {"NoBuffers", [] { return hb_daemon_route_mcast(nullptr, 1, 80, nodes.data(), 3); }, 4},
      {"TooManyBuffers", [] { return hb_daemon_route_mcast(&buffer, 7, 80, nodes.data(), 3); }, 4},
      {"NoNodes", [] { return hb_daemon_route_mcast(&buffer, 1, 80, nodes.data(), 0); }, 4},
      {"NoPlaceForASequence", [] { return hb_get_security_sequence(nullptr); }, 4},
      {"NoPlacesForKeys", [] { return hb_get_security_infomation(nullptr, nullptr, nullptr); }, 4},
  };
}

class EarlyArguments : public testing::TestWithParam<Refused_Call> {
 protected:
  EarlyArguments() {
    forget_leftovers();
    reset_platform();
    operation_outputs.clear();
  }
  ~EarlyArguments() override { EXPECT_TRUE(operation_outputs.untouched()); }

  static Hb_Rc call() { return GetParam().call(); }
};

TEST_P(EarlyArguments, FailAsTheStartDoes) {
  FakeDaemon daemon;
  daemon.stop_listening();
  EXPECT_TRUE(fails_with(15, call));
}

TEST_P(EarlyArguments, AreRefusedOnceTheCallHasStartedTheClient) {
  FakeDaemon daemon(Publication::for_nodes(8));
  daemon.serve_configuration(configuration_answer(sparse_cluster()));
  EXPECT_TRUE(GetParam().error == 0 ? succeeds(call) : fails_with(GetParam().error, call));
  EXPECT_EQ(Hb_True, client_initialized);
  EXPECT_FALSE(daemon.take_connection().has_input());
  hb_terminate();
}

INSTANTIATE_TEST_SUITE_P(Control, EarlyArguments, testing::ValuesIn(refused_calls()),
                         [](const auto& test) { return std::string(test.param.name); });

}  // namespace
}  // namespace hb_test
