/* Kernel messages, written by hand, and the cluster that comes of them. */
#include "host_table.h"

#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <linux/if.h>
#include <linux/if_addr.h>
#include <linux/if_arp.h>
#include <linux/if_link.h>
#include <linux/rtnetlink.h>

#include <array>
#include <cstring>

#include "address.h"
#include "host_cluster.h"

namespace {

using hbd::HostCluster;
using hbd::HostTable;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr unsigned running = IFF_UP | IFF_RUNNING;

/* A message under construction. */
class Message {
 public:
  explicit Message(unsigned type) : header_(mnl_nlmsg_put_header(buffer_.data())) {
    header_->nlmsg_type = static_cast<std::uint16_t>(type);
  }
  template <typename Header>
  Header& extra() {
    return *static_cast<Header*>(mnl_nlmsg_put_extra_header(header_, sizeof(Header)));
  }
  void put(unsigned type, const void* data, std::size_t size) {
    mnl_attr_put(header_, static_cast<std::uint16_t>(type), size, data);
  }
  nlmsghdr& header() { return *header_; }

 private:
  alignas(nlmsghdr) std::array<char, 1024> buffer_{};
  nlmsghdr* header_;
};

void link(HostTable& table, int index, const std::string& name, unsigned flags, unsigned hardware = ARPHRD_ETHER,
          unsigned type = RTM_NEWLINK) {
  Message message(type);
  auto& header = message.extra<ifinfomsg>();
  header.ifi_index = index;
  header.ifi_flags = flags;
  header.ifi_type = static_cast<unsigned short>(hardware);
  message.put(IFLA_IFNAME, name.c_str(), name.size() + 1);
  table.take(message.header());
}

void address(HostTable& table, int index, const std::string& text, unsigned type = RTM_NEWADDR, unsigned flags = 0,
             unsigned prefix = 24) {
  const bool six = text.find(':') != std::string::npos;
  Message message(type);
  auto& header = message.extra<ifaddrmsg>();
  header.ifa_family = six ? AF_INET6 : AF_INET;
  header.ifa_index = static_cast<unsigned>(index);
  header.ifa_prefixlen = static_cast<unsigned char>(prefix);
  std::array<std::uint8_t, 16> bytes{};
  inet_pton(header.ifa_family, text.c_str(), bytes.data());
  message.put(six ? IFA_ADDRESS : IFA_LOCAL, bytes.data(), six ? 16 : 4);
  const std::uint32_t flag_bits = flags;
  message.put(IFA_FLAGS, &flag_bits, sizeof(flag_bits));
  table.take(message.header());
}

std::vector<std::string> addresses(const HostTable& table) {
  std::vector<std::string> texts;
  for (const auto& each : table.addresses()) {
    Hb_IP_address6 copy{};
    std::memcpy(&copy, each.bytes.data(), sizeof(copy));
    texts.push_back(std::to_string(each.interface) + " " + hbd::address_text(copy));
  }
  return texts;
}

TEST(HostTable, takes_name_kind_and_state_of_an_interface) {
  HostTable table;
  link(table, 3, "en0", running);
  link(table, 1, "lo", IFF_UP, ARPHRD_LOOPBACK);
  link(table, 2, "en1", IFF_RUNNING);
  ASSERT_EQ(table.interfaces().size(), 3U);
  EXPECT_EQ(table.interfaces().at(3).name, "en0");
  EXPECT_TRUE(table.interfaces().at(3).running);
  EXPECT_EQ(table.interfaces().at(1).hardware, ARPHRD_LOOPBACK);
  EXPECT_TRUE(table.interfaces().at(1).on);
  EXPECT_FALSE(table.interfaces().at(1).running);
  EXPECT_FALSE(table.interfaces().at(2).on);
  EXPECT_FALSE(table.interfaces().at(2).running);
}

TEST(HostTable, takes_addresses_of_both_families_and_forgets_them) {
  HostTable table;
  address(table, 3, "192.0.2.1");
  address(table, 3, "2001:db8::1");
  EXPECT_THAT(addresses(table), testing::UnorderedElementsAre("3 192.0.2.1", "3 2001:db8::1"));
  address(table, 3, "192.0.2.1", RTM_DELADDR);
  EXPECT_THAT(addresses(table), ElementsAre("3 2001:db8::1"));
}

TEST(HostTable, takes_the_prefix_of_an_address_whenever_it_is_told) {
  HostTable table;
  address(table, 3, "192.0.2.1", RTM_NEWADDR, 0, 24);
  ASSERT_EQ(table.addresses().size(), 1U);
  EXPECT_EQ(table.addresses().begin()->prefix_length, 24);
  address(table, 3, "192.0.2.1", RTM_NEWADDR, 0, 28);
  ASSERT_EQ(table.addresses().size(), 1U);
  EXPECT_EQ(table.addresses().begin()->prefix_length, 28);
}

TEST(HostTable, tells_families_apart) {
  HostTable table;
  address(table, 3, "192.0.2.1");
  address(table, 4, "2001:db8::ffff:192.0.2.1");
  ASSERT_EQ(table.addresses().size(), 2U);
  EXPECT_TRUE(table.addresses().begin()->is_ipv4());
  EXPECT_FALSE(table.addresses().rbegin()->is_ipv4());
}

TEST(HostTable, forgets_the_addresses_of_an_interface_that_is_gone) {
  HostTable table;
  link(table, 3, "en0", running);
  address(table, 3, "192.0.2.1");
  address(table, 4, "192.0.2.2");
  link(table, 3, "en0", 0, ARPHRD_ETHER, RTM_DELLINK);
  EXPECT_THAT(table.interfaces(), IsEmpty());
  EXPECT_THAT(addresses(table), ElementsAre("4 192.0.2.2"));
}

TEST(HostTable, leaves_out_an_address_until_it_is_known_to_be_no_duplicate) {
  HostTable table;
  address(table, 3, "2001:db8::1", RTM_NEWADDR, IFA_F_TENTATIVE);
  EXPECT_THAT(addresses(table), IsEmpty());
  address(table, 3, "2001:db8::1", RTM_NEWADDR, 0);
  EXPECT_THAT(addresses(table), ElementsAre("3 2001:db8::1"));
  address(table, 3, "2001:db8::1", RTM_NEWADDR, IFA_F_DADFAILED);
  EXPECT_THAT(addresses(table), IsEmpty());
}

TEST(HostTable, takes_the_near_end_of_a_link_between_two) {
  HostTable table;
  Message message(RTM_NEWADDR);
  auto& header = message.extra<ifaddrmsg>();
  header.ifa_family = AF_INET;
  header.ifa_index = 5;
  const std::array<std::uint8_t, 4> far = {192, 0, 2, 200};
  const std::array<std::uint8_t, 4> near = {192, 0, 2, 100};
  message.put(IFA_ADDRESS, far.data(), far.size());
  message.put(IFA_LOCAL, near.data(), near.size());
  table.take(message.header());
  EXPECT_THAT(addresses(table), ElementsAre("5 192.0.2.100"));
}

TEST(HostTable, ignores_messages_that_are_too_short_or_of_another_kind) {
  HostTable table;
  for (const unsigned type : {RTM_NEWLINK, RTM_DELLINK, RTM_NEWADDR, RTM_DELADDR, RTM_NEWROUTE}) {
    Message message(type);
    table.take(message.header());
  }
  Message odd(RTM_NEWADDR);
  odd.extra<ifaddrmsg>().ifa_family = AF_INET;
  odd.put(IFA_LOCAL, "abc", 3);
  table.take(odd.header());
  EXPECT_THAT(table.interfaces(), IsEmpty());
  EXPECT_THAT(table.addresses(), IsEmpty());
}

HostTable two_interfaces() {
  HostTable table;
  link(table, 1, "lo", running, ARPHRD_LOOPBACK);
  link(table, 2, "en0", running);
  address(table, 1, "127.0.0.1");
  address(table, 2, "192.0.2.1");
  return table;
}

TEST(HostCluster, has_one_node_an_adapter_for_each_address_and_a_network_for_each_kind_of_interface) {
  const HostCluster cluster(two_interfaces());
  const auto& configuration = cluster.configuration();
  EXPECT_EQ(configuration.local_node, 0);
  EXPECT_EQ(configuration.max_nodes, 1);
  EXPECT_EQ(configuration.adapters_per_node, 48);
  ASSERT_EQ(configuration.networks.size(), 2U);
  EXPECT_EQ(configuration.networks[0].name, "loopback");
  EXPECT_EQ(configuration.networks[1].name, "ethernet");
  ASSERT_EQ(configuration.adapters.size(), 2U);
  EXPECT_EQ(configuration.adapters.at(0).type, "lo");
  EXPECT_EQ(hbd::address_text(configuration.adapters.at(1).address), "192.0.2.1");
  EXPECT_EQ(configuration.adapters.at(1).type, "en0");
  EXPECT_EQ(configuration.adapters.at(1).network, 1);
}

TEST(HostCluster, changes_nothing_while_the_table_stays) {
  HostCluster cluster(two_interfaces());
  EXPECT_THAT(cluster.changes_to(two_interfaces()), IsEmpty());
}

TEST(HostCluster, tells_a_link_that_goes_down_and_comes_up_as_deaths_and_joins_of_its_adapters) {
  HostTable table = two_interfaces();
  address(table, 2, "192.0.2.2");
  HostCluster cluster(table);
  link(table, 2, "en0", IFF_UP);
  const auto down = cluster.changes_to(table);
  ASSERT_EQ(down.size(), 1U);
  EXPECT_THAT(std::get<hbd::AdapterDeath>(down[0]).adapters, ElementsAre(1, 2));
  link(table, 2, "en0", running);
  const auto up = cluster.changes_to(table);
  ASSERT_EQ(up.size(), 1U);
  EXPECT_THAT(std::get<hbd::AdapterJoin>(up[0]).adapters, ElementsAre(1, 2));
}

TEST(HostCluster, tells_an_address_that_comes_or_goes_as_a_configuration_change) {
  HostTable table = two_interfaces();
  HostCluster cluster(table);
  link(table, 3, "tun0", running, ARPHRD_NONE);
  address(table, 3, "198.51.100.1");
  const auto more = cluster.changes_to(table);
  ASSERT_EQ(more.size(), 1U);
  const auto& added = std::get<hbd::ConfigurationChange>(more[0]);
  ASSERT_EQ(added.add.size(), 1U);
  EXPECT_EQ(added.add[0].number, 2U);
  EXPECT_EQ(added.add[0].network, 2);
  ASSERT_EQ(added.add_networks.size(), 1U);
  EXPECT_EQ(added.add_networks[0].name, "tunnel");

  address(table, 1, "127.0.0.1", RTM_DELADDR);
  const auto fewer = cluster.changes_to(table);
  ASSERT_EQ(fewer.size(), 1U);
  EXPECT_THAT(std::get<hbd::ConfigurationChange>(fewer[0]).remove, ElementsAre(0));
}

TEST(HostCluster, keeps_numbers_and_gives_free_ones_to_new_addresses) {
  HostTable table = two_interfaces();
  HostCluster cluster(table);
  address(table, 1, "127.0.0.1", RTM_DELADDR);
  cluster.changes_to(table);
  address(table, 2, "192.0.2.7");
  const auto changes = cluster.changes_to(table);
  ASSERT_EQ(changes.size(), 1U);
  EXPECT_EQ(std::get<hbd::ConfigurationChange>(changes[0]).add.at(0).number, 0U);
}

TEST(HostCluster, configures_an_adapter_as_down_while_its_link_is) {
  HostTable table;
  link(table, 2, "en0", IFF_UP);
  address(table, 2, "192.0.2.1");
  const HostCluster cluster(table);
  EXPECT_FALSE(cluster.configuration().adapters.at(0).up);
}

TEST(HostCluster, leaves_out_addresses_beyond_48_and_addresses_without_an_interface) {
  HostTable table;
  address(table, 9, "192.0.2.250");
  link(table, 2, "en0", running);
  for (int i = 1; i <= 60; ++i) {
    address(table, 2, "192.0.2." + std::to_string(i));
  }
  HostCluster cluster(table);
  EXPECT_EQ(cluster.configuration().adapters.size(), 48U);
  EXPECT_THAT(cluster.changes_to(table), IsEmpty());
}

}  // namespace
