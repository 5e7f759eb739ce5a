/* Requests that change this host's interfaces, in a network of the test's own where that is allowed. */
#include <gmock/gmock.h>
#include <sys/socket.h>

#include <cerrno>
#include <thread>

#include "daemon_process.h"
#include "host_network.h"
#include "steering.h"

namespace {

using testing::HasSubstr;

constexpr std::uint32_t enable = 207;
constexpr std::uint32_t disable = 208;
constexpr std::uint32_t interface_down = 212;
constexpr std::uint32_t interface_up = 213;
constexpr std::uint32_t configure = 214;
constexpr std::uint32_t unconfigure = 215;
constexpr std::uint32_t swap_addresses = 218;
constexpr std::uint32_t get_state = 223;
constexpr std::uint32_t start_manual_control = 225;
constexpr std::uint32_t end_manual_control = 226;

constexpr std::uint32_t configured = 10;
constexpr std::uint32_t free_address = address4(192, 0, 2, 9);
constexpr std::uint32_t up = 1;
constexpr std::uint32_t down = 2;

/* A daemon that follows a loopback interface, which is network 0. */
class HostRequest : public testing::Test {
 protected:
  HostRequest() : is_allowed_(enter_own_network()) {
    if (is_allowed_) {
      interfaces_.set_up("lo", true);
    }
  }

  void start(const Bytes& loopback_address = ipv4(127, 0, 0, 1)) {
    daemon_.emplace(directory_, std::vector<std::string>{"--socket", directory_.path("socket"), "--host"});
    ASSERT_TRUE(daemon_->wait_until_ready()) << daemon_->log();
    client_.emplace(directory_.path("socket"));
    const auto loopback = found(loopback_address);
    ASSERT_TRUE(loopback);
    number_ = loopback->number;
  }

  /* An adapter of the configuration as it is. */
  std::optional<Found> found(const Bytes& address) {
    const auto configuration = Connection(directory_.path("socket")).configuration();
    return configuration ? find_adapter(*configuration, address) : std::nullopt;
  }

  /* The update in which one address is there and another one is not. */
  std::optional<Bytes> wait_for_update(const Bytes& there, const Bytes& gone) {
    auto update = wait_for_configuration(*client_);
    while (update && (!find_adapter(*update, there) || find_adapter(*update, gone))) {
      update = wait_for_configuration(*client_);
    }
    return update;
  }

  /* Has the client told of the adapter's deaths and joins. An adapter with an IPv6 address goes with its address. */
  void follow_adapter() {
    ASSERT_LT(number_, 8U);
    client_->subscribe(SubscriptionType::Adapter, 3, "s", {static_cast<std::uint8_t>(0x80U >> number_)});
  }

  /* Has the client told of updates from here on. */
  void follow() { ASSERT_TRUE(client_->configuration()); }

  std::uint32_t state() {
    const Bytes packet = ask(*client_, steer(get_state, 0));
    EXPECT_EQ(field(packet, 0), 14U);
    EXPECT_EQ(field(packet, 56), 0U);
    return field(packet, 108);
  }

  /* Without the right nothing changes, whoever's network it is. Other threads keep the right. */
  void expect_refusal() {
    std::thread([this] {
      give_up_the_right_to_networks();
      start();
      steer_in_vain();
      daemon_.reset(); /* it ends with the thread that has started it */
    }).join();
  }

  void steer_in_vain() {
    client_->send(steer(interface_down, 0));
    EXPECT_EQ(state(), 2U);
    client_->send(steer(disable, 0));
    EXPECT_EQ(ask(*client_, steer(configure, 0, free_address)), answer(configured, 7));
    EXPECT_EQ(ask(*client_, steer(unconfigure, 0)), answer(configured, 7));
    client_->send(steer(enable, 0));
    EXPECT_EQ(state(), 2U);
    EXPECT_FALSE(found(ipv4(192, 0, 2, 9)));
    EXPECT_THAT(daemon_->log(), HasSubstr("switching the interface of lo failed: Operation not permitted; run the "
                                          "daemon with the capability to administer networks"));
  }

  bool is_allowed_;
  Interfaces interfaces_;
  TemporaryDirectory directory_;
  std::optional<DaemonProcess> daemon_;
  std::optional<Connection> client_;
  std::uint32_t number_ = 0;
};

TEST_F(HostRequest, without_the_right_is_answered_that_it_is_not_supported) { expect_refusal(); }

TEST_F(HostRequest, switches_the_interface_off_and_on_and_its_address_stays) {
  if (!is_allowed_) {
    expect_refusal();
    return;
  }
  start();
  EXPECT_EQ(state(), 2U);
  follow_adapter();
  client_->send(steer(interface_down, 0));
  EXPECT_EQ(wait_for(*client_, 2, number_), 1U);
  EXPECT_EQ(state(), 4U);
  ASSERT_TRUE(found(ipv4(127, 0, 0, 1)));
  EXPECT_EQ(found(ipv4(127, 0, 0, 1))->number, number_);
  EXPECT_EQ(found(ipv4(127, 0, 0, 1))->state, down);
  client_->send(steer(interface_up, 0));
  EXPECT_EQ(wait_for(*client_, 3, number_), 2U);
  EXPECT_EQ(state(), 2U);
}

TEST_F(HostRequest, to_switch_an_interface_is_told_when_manual_control_ends) {
  if (!is_allowed_) {
    expect_refusal();
    return;
  }
  start();
  follow_adapter();
  client_->send(request(start_manual_control, {'l', 'o'}));
  client_->send(steer(interface_down, 0));
  while (state() != 4U) { /* until the kernel has told so */
  }
  EXPECT_EQ(found(ipv4(127, 0, 0, 1))->state, up);
  client_->send(request(end_manual_control, {'l', 'o'}));
  EXPECT_EQ(wait_for(*client_, 2, number_), 1U);
}

TEST_F(HostRequest, takes_another_address_and_removes_it) {
  if (!is_allowed_) {
    expect_refusal();
    return;
  }
  start();
  follow();
  EXPECT_EQ(ask(*client_, steer(configure, 0, free_address)), answer(configured, 3));
  client_->send(steer(disable, 0));
  EXPECT_EQ(ask(*client_, steer(configure, 0, address4(127, 0, 0, 1))), answer(configured, 6));
  EXPECT_EQ(ask(*client_, steer(configure, 0, free_address)), answer(configured, 0));
  const auto update = wait_for_update(ipv4(192, 0, 2, 9), ipv4(127, 0, 0, 1));
  ASSERT_TRUE(update);
  EXPECT_EQ(find_adapter(*update, ipv4(192, 0, 2, 9))->state, up);
  EXPECT_EQ(interfaces_.address("lo"), "192.0.2.9");
  EXPECT_EQ(interfaces_.mask("lo"), "255.0.0.0");
  /* It is monitored from then on. */
  EXPECT_EQ(state(), 2U);

  client_->send(steer(disable, 0));
  EXPECT_EQ(ask(*client_, steer(unconfigure, 0)), answer(configured, 0));
  const auto after = wait_for_configuration(*client_);
  ASSERT_TRUE(after);
  EXPECT_FALSE(find_adapter(*after, ipv4(192, 0, 2, 9)));
  EXPECT_EQ(interfaces_.address("lo"), "");
}

TEST_F(HostRequest, brings_back_the_addresses_that_the_kernel_removes_with_one) {
  if (!is_allowed_) {
    expect_refusal();
    return;
  }
  write_to("/proc/sys/net/ipv4/conf/lo/promote_secondaries", "0");
  write_to("/proc/sys/net/ipv4/conf/all/promote_secondaries", "0");
  interfaces_.set_address("lo:1", "127.9.9.9");
  start();
  follow();
  client_->send(steer(disable, 0));
  EXPECT_EQ(ask(*client_, steer(configure, 0, free_address)), answer(configured, 0));
  const auto update = wait_for_update(ipv4(192, 0, 2, 9), ipv4(127, 0, 0, 1));
  ASSERT_TRUE(update);
  EXPECT_TRUE(find_adapter(*update, ipv4(127, 9, 9, 9)));
  daemon_.reset();
  start(ipv4(127, 9, 9, 9)); /* the kernel has it, and not the daemon alone */
}

TEST_F(HostRequest, takes_an_ipv4_address_where_there_are_ipv6_addresses_alone) {
  if (!is_allowed_) {
    expect_refusal();
    return;
  }
  const int ipv6 = socket(AF_INET6, SOCK_DGRAM, 0);
  if (ipv6 == -1) {
    EXPECT_EQ(errno, EAFNOSUPPORT);
    return;
  }
  close(ipv6);
  interfaces_.set_address("lo", "0.0.0.0");
  const Bytes loopback = ByteWriter().zeros(15).u8(1).bytes();
  start(loopback);
  follow();
  EXPECT_EQ(state(), 2U);
  client_->send(steer(disable, 0));
  EXPECT_EQ(ask(*client_, steer(configure, 0, free_address)), answer(configured, 0));
  EXPECT_TRUE(wait_for_update(ipv4(192, 0, 2, 9), loopback));
  EXPECT_EQ(interfaces_.address("lo"), "192.0.2.9");
  EXPECT_EQ(interfaces_.mask("lo"), "255.255.255.255");
}

TEST_F(HostRequest, swaps_the_addresses_of_two_interfaces) {
  if (!is_allowed_) {
    expect_refusal();
    return;
  }
  if (!interfaces_.add_bridge("hb0")) {
    EXPECT_TRUE(errno == ENOPKG || errno == ENOTTY || errno == EPERM) << std::strerror(errno);
    return;
  }
  interfaces_.set_address("hb0", "192.0.2.1");
  start();
  follow();
  client_->send(steer(disable, 0));
  EXPECT_EQ(ask(*client_, steer(swap_addresses, 0, address4(192, 0, 2, 1))), answer(configured, 0));
  const auto update = wait_for_configuration(*client_);
  ASSERT_TRUE(update);
  ASSERT_TRUE(find_adapter(*update, ipv4(192, 0, 2, 1)));
  EXPECT_EQ(find_adapter(*update, ipv4(192, 0, 2, 1))->type, "lo");
  ASSERT_TRUE(find_adapter(*update, ipv4(127, 0, 0, 1)));
  EXPECT_EQ(find_adapter(*update, ipv4(127, 0, 0, 1))->type, "hb0");
  EXPECT_EQ(interfaces_.address("lo"), "192.0.2.1");
  EXPECT_EQ(interfaces_.mask("lo"), "255.255.255.0");
  EXPECT_EQ(interfaces_.address("hb0"), "127.0.0.1");
}

}  // namespace
