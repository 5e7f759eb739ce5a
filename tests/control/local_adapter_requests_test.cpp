// Requests about an adapter of this node: what is checked before sending, in which order, and the bytes sent.
#include <gtest/gtest.h>

#include <functional>
#include <ostream>
#include <utility>

#include "hash.h"
#include "hb_communication/control_requests.h"
#include "steering.h"

namespace hb_test {
namespace {

struct Adapter_Request {
  const char* name;
  std::function<Hb_Rc(Hb_Adapter_Number)> call;
  int32_t code;
  Bytes value;   // behind the network number and two bytes of zero; empty when there is none
  Bytes answer;  // a good one, sent beforehand; empty when none is awaited
};

void PrintTo(const Adapter_Request& request, std::ostream* stream) { *stream << request.name; }

Hb_Adapter_state_t state_output;

Bytes good_answer(int32_t kind) { return ReplyPacket(kind).message(octets({2, 0, 0, 0})).bytes(); }

const Adapter_Request adapter_requests[] = {
    {"hb_enable_adapter", hb_enable_adapter, 207, {}, {}},
    {"hb_disable_adapter", hb_disable_adapter, 208, {}, {}},
    {"hb_ifconfig_down", hb_ifconfig_down, 212, {}, {}},
    {"hb_ifconfig_up", hb_ifconfig_up, 213, {}, {}},
    {"hb_configure_adapter",
     [](Hb_Adapter_Number adapter) {
       return hb_configure_adapter(adapter, ipv4({10, 9, 8, 7}));
     },
     214, octets({10, 9, 8, 7}), good_answer(10)},
    {"hb_unconfigure_adapter", hb_unconfigure_adapter, 215, {}, good_answer(10)},
    {"hb_adapter_grace", [](Hb_Adapter_Number adapter) { return hb_adapter_grace(adapter, 0x01020304); }, 216,
     octets({4, 3, 2, 1}), good_answer(11)},
    {"hb_swap_adapters",
     [](Hb_Adapter_Number adapter) {
       return hb_swap_adapters(adapter, ipv4({10, 0, 0, 3}));
     },
     218, octets({10, 0, 0, 3}), good_answer(10)},
    {"hb_get_adapter_state",
     [](Hb_Adapter_Number adapter) { return hb_get_adapter_state(adapter, &state_output); },
     223,
     {},
     good_answer(14)},
};

std::string name_of_request(const testing::TestParamInfo<Adapter_Request>& test) { return test.param.name; }

Bytes expected_request(const Adapter_Request& request, uint8_t low, uint8_t high) {
  return request_with(request.code,
                      request.value.empty() ? octets({low, high}) : octets({low, high, 0, 0}) + request.value);
}

class LocalAdapterRequest : public Steering, public testing::WithParamInterface<Adapter_Request> {
 protected:
  explicit LocalAdapterRequest(const ConfigurationMessage& configuration = sparse_cluster())
      : Steering(configuration) {}

  Hb_Rc request(Hb_Adapter_Number adapter) {
    if (!GetParam().answer.empty()) {
      connection.send_frame(GetParam().answer);
    }
    return GetParam().call(adapter);
  }

  testing::AssertionResult is_refused_with(int error, Hb_Adapter_Number adapter) {
    return refuses(error, [&] { return GetParam().call(adapter); });
  }
};

TEST_P(LocalAdapterRequest, CarriesTheAdaptersNetworkAndItsValue) {
  EXPECT_TRUE(succeeds([this] { return request(13); }));
  EXPECT_TRUE(sent(expected_request(GetParam(), 1, 0)));
  EXPECT_TRUE(succeeds([this] { return request(12); }));
  EXPECT_TRUE(sent(expected_request(GetParam(), 0, 0)));
}

TEST_P(LocalAdapterRequest, ForANumberBeyondTheClusterIsInvalid) {
  EXPECT_TRUE(is_refused_with(4, 32));
  EXPECT_TRUE(is_refused_with(4, 0x80000000U));
  EXPECT_TRUE(is_refused_with(4, 0xFFFFFFFFU));
}

TEST_P(LocalAdapterRequest, ForAnUnknownAdapterWithinTheClusterFindsNone) {
  EXPECT_TRUE(is_refused_with(7, 14));  // a free slot of this node
  EXPECT_TRUE(is_refused_with(7, 31));  // the last number, and of another node
  EXPECT_TRUE(is_refused_with(7, 1));
}

TEST_P(LocalAdapterRequest, ForAnAdapterOfAnotherNodeIsInvalid) {
  EXPECT_TRUE(is_refused_with(4, 0));
  EXPECT_TRUE(is_refused_with(4, 2));
  EXPECT_TRUE(is_refused_with(4, 17));
}

INSTANTIATE_TEST_SUITE_P(Control, LocalAdapterRequest, testing::ValuesIn(adapter_requests), name_of_request);

// All slots of this node and their neighbours are configured, and networks need both bytes of their number.
ConfigurationMessage full_node() {
  return ConfigurationMessage()
      .local_node(3)
      .max_nodes(8)
      .adapters_per_node(4)
      .adapter(11, "10.0.0.2", 0)
      .adapter(12, "10.0.0.3", 258)
      .adapter(15, "10.0.1.3", -2)
      .adapter(16, "10.0.0.4", 0)
      .adapter(32, "10.0.0.8", 0)
      .network("net_ether_01");
}

class AdapterOfAFullNode : public LocalAdapterRequest {
 protected:
  AdapterOfAFullNode() : LocalAdapterRequest(full_node()) {}
};

TEST_P(AdapterOfAFullNode, IsLocalFromTheFirstSlotToTheLast) {
  EXPECT_TRUE(succeeds([this] { return request(12); }));
  EXPECT_TRUE(sent(expected_request(GetParam(), 2, 1)));
  EXPECT_TRUE(succeeds([this] { return request(15); }));
  EXPECT_TRUE(sent(expected_request(GetParam(), 0xFE, 0xFF)));
  EXPECT_TRUE(is_refused_with(4, 11));
  EXPECT_TRUE(is_refused_with(4, 16));
}

TEST_P(AdapterOfAFullNode, BeyondTheClusterIsInvalidThoughItIsInTheList) { EXPECT_TRUE(is_refused_with(4, 32)); }

INSTANTIATE_TEST_SUITE_P(Control, AdapterOfAFullNode, testing::ValuesIn(adapter_requests), name_of_request);

class LocalAdapter : public Steering {};

TEST_F(LocalAdapter, SendsAnyKindOfRequestWithOrWithoutAValue) {
  uint32_t value = 0x0A0B0C0D;
  EXPECT_TRUE(succeeds([&] { return hb_config_local_adapter(13, HB_SIMULATE_DEATH, &value); }));
  EXPECT_TRUE(sent(request_with(217, octets({1, 0, 0, 0, 0x0D, 0x0C, 0x0B, 0x0A}))));
  EXPECT_TRUE(succeeds([&] { return hb_config_local_adapter(13, HB_CONFIGURE_ADAPTER, nullptr); }));
  EXPECT_TRUE(sent(request_with(214, octets({1, 0}))));
}

TEST_F(LocalAdapter, MayGetAnyAddress) {
  for (const Hb_IP_address4 address : {ipv4({0, 0, 0, 0}), ipv4({255, 255, 255, 255})}) {
    connection.send_frame(good_answer(10));
    EXPECT_TRUE(succeeds([&] { return hb_configure_adapter(12, address); }));
    const auto byte = static_cast<uint8_t>(address & 0xFFU);
    EXPECT_TRUE(sent(request_with(214, octets({0, 0, 0, 0, byte, byte, byte, byte}))));
  }
}

TEST_F(LocalAdapter, MayGetAnyGrace) {
  for (const int seconds : {0, -1}) {
    connection.send_frame(good_answer(11));
    EXPECT_TRUE(succeeds([&] { return hb_adapter_grace(12, seconds); }));
    const auto byte = static_cast<uint8_t>(seconds);
    EXPECT_TRUE(sent(request_with(216, octets({0, 0, 0, 0, byte, byte, byte, byte}))));
  }
}

TEST_F(LocalAdapter, IsNotFoundInATableThatIsNotThere) {
  H_table_str* const adapters = std::exchange(global_config_tbl.adap_hash, nullptr);
  H_table_str* const addresses = std::exchange(global_config_tbl.ip_hash, nullptr);
  EXPECT_TRUE(refuses(7, [] { return hb_enable_adapter(13); }));
  EXPECT_TRUE(refuses(7, [] { return hb_swap_adapters(13, ipv4({10, 0, 0, 3})); }));
  EXPECT_TRUE(refuses(7, [] { return hb_adapter_is_down(13); }));
  global_config_tbl.adap_hash = adapters;
  global_config_tbl.ip_hash = addresses;
}

TEST_F(LocalAdapter, IsNotAskedForItsStateWithoutAPlaceForIt) {
  EXPECT_TRUE(refuses(4, [] { return hb_get_adapter_state(13, nullptr); }));
}

// Swapping: the other adapter is checked first.

class Swap : public Steering {
 protected:
  explicit Swap(const ConfigurationMessage& configuration = sparse_cluster()) : Steering(configuration) {}

  testing::AssertionResult is_refused_with(int error, Hb_Adapter_Number adapter, Hb_IP_address4 address) {
    return refuses(error, [&] { return hb_swap_adapters(adapter, address); });
  }
};

TEST_F(Swap, WithAnAddressThatNoAdapterHasFindsNone) {
  EXPECT_TRUE(is_refused_with(7, 13, ipv4({10, 0, 0, 4})));
  EXPECT_TRUE(is_refused_with(7, 13, ipv4({0, 0, 0, 0})));
}

TEST_F(Swap, TakesTheBytesOfTheAddressInTheirOrder) { EXPECT_TRUE(is_refused_with(7, 13, ipv4({3, 0, 0, 10}))); }

TEST_F(Swap, WithAnAdapterOfAnotherNodeIsInvalid) {
  EXPECT_TRUE(is_refused_with(4, 13, ipv4({10, 0, 1, 4})));
  EXPECT_TRUE(is_refused_with(4, 13, ipv4({10, 0, 0, 10})));
}

TEST_F(Swap, ChecksTheOtherAdapterBeforeTheAdapter) {
  EXPECT_TRUE(is_refused_with(7, 32, ipv4({10, 0, 0, 4})));
  EXPECT_TRUE(is_refused_with(7, 0, ipv4({10, 0, 0, 4})));
  EXPECT_TRUE(is_refused_with(4, 14, ipv4({10, 0, 1, 4})));
}

TEST_F(Swap, WithAnAdapterThatTheTableHasLostFindsNone) {
  ASSERT_NE(nullptr, Hash_delete(12, global_config_tbl.adap_hash));
  EXPECT_TRUE(is_refused_with(7, 13, ipv4({10, 0, 0, 3})));
}

TEST_F(Swap, WithItselfIsForTheDaemonToJudge) {
  connection.send_frame(good_answer(10));
  EXPECT_TRUE(succeeds([] { return hb_swap_adapters(13, ipv4({10, 0, 1, 3})); }));
  EXPECT_TRUE(sent(request_with(218, octets({1, 0, 0, 0, 10, 0, 1, 3}))));
}

class SwapWithLookalikes : public Swap {
 protected:
  SwapWithLookalikes()
      : Swap(ConfigurationMessage()
                 .local_node(0)
                 .max_nodes(2)
                 .adapters_per_node(3)
                 .adapter(0, "::10.0.0.1")
                 .adapter(1, "fe80::ffff:10.0.0.1")
                 .adapter(3, "10.0.0.1")
                 .network("net0")) {}
};

TEST_F(SwapWithLookalikes, LooksForTheMappedAddress) { EXPECT_TRUE(is_refused_with(4, 0, ipv4({10, 0, 0, 1}))); }

}  // namespace
}  // namespace hb_test
