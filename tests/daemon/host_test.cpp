/* The daemon that follows this host, in a network of the test's own where that is allowed. */
#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <net/if.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "daemon_process.h"
#include "wire.h"

namespace {

/* Moves this process, and what it starts, into a network that has nothing but a loopback interface. */
bool enter_own_network() { return unshare(CLONE_NEWNET) == 0 || unshare(CLONE_NEWUSER | CLONE_NEWNET) == 0; }

/* Changes interfaces by ioctl. */
class InterfaceControl {
 public:
  ~InterfaceControl() { close(socket_); }

  void set_up(const char* name, bool up) const {
    ifreq request = named(name);
    ASSERT_EQ(ioctl(socket_, SIOCGIFFLAGS, &request), 0) << std::strerror(errno);
    request.ifr_flags = static_cast<short>(up ? request.ifr_flags | IFF_UP : request.ifr_flags & ~IFF_UP);
    ASSERT_EQ(ioctl(socket_, SIOCSIFFLAGS, &request), 0) << std::strerror(errno);
  }

  void add_address(const char* alias, const char* address) const {
    ifreq request = named(alias);
    auto& field = reinterpret_cast<sockaddr_in&>(request.ifr_addr);
    field.sin_family = AF_INET;
    inet_pton(AF_INET, address, &field.sin_addr);
    ASSERT_EQ(ioctl(socket_, SIOCSIFADDR, &request), 0) << std::strerror(errno);
  }

 private:
  static ifreq named(const char* name) {
    ifreq request{};
    std::strncpy(request.ifr_name, name, IFNAMSIZ - 1);
    return request;
  }

  int socket_ = socket(AF_INET, SOCK_DGRAM, 0);
};

/* The adapter record of an IPv4 address in a configuration message; its number and state. */
struct Found {
  std::uint32_t number;
  std::uint32_t state;
  std::string type;
};

std::optional<Found> find_adapter(const Bytes& configuration, const Bytes& address) {
  const std::uint32_t count = field(configuration, 108 + 12);
  for (std::uint32_t i = 0; i < count; ++i) {
    const std::size_t record = 108 + 52 + std::size_t{i} * 64;
    if (std::equal(address.begin(), address.end(), configuration.begin() + static_cast<std::ptrdiff_t>(record))) {
      return Found{field(configuration, record + 56), field(configuration, record + 60),
                   text_field(configuration, record + 18)};
    }
  }
  return std::nullopt;
}

Bytes ipv4(unsigned a, unsigned b, unsigned c, unsigned d) {
  return ByteWriter().zeros(10).u8(0xFF).u8(0xFF).u8(a).u8(b).u8(c).u8(d).bytes();
}

/* The incarnation that an event of a kind gives for an adapter, once such an event comes. */
std::optional<std::uint32_t> wait_for(Connection& client, std::uint32_t kind, std::uint32_t adapter) {
  for (auto packet = client.receive(); packet; packet = client.receive()) {
    if (field(*packet, 0) != kind) {
      continue;
    }
    for (std::uint32_t i = 0; i <= field(*packet, 108); ++i) {
      if (field(*packet, 112 + std::size_t{i} * 8) == adapter) {
        return field(*packet, 116 + std::size_t{i} * 8);
      }
    }
  }
  return std::nullopt;
}

std::optional<Bytes> wait_for_configuration(Connection& client) {
  auto packet = client.receive();
  while (packet && field(*packet, 0) != 9) {
    packet = client.receive();
  }
  return packet;
}

TEST(Host, lists_the_loopback_interface_as_an_adapter_that_is_up) {
  if (enter_own_network()) {
    InterfaceControl().set_up("lo", true);
  }
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, {"--socket", directory.path("socket"), "--host"});
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const auto configuration = Connection(directory.path("socket")).configuration();
  ASSERT_TRUE(configuration);
  EXPECT_EQ(field(*configuration, 108), 0U);     /* local node */
  EXPECT_EQ(field(*configuration, 108 + 4), 1U); /* nodes */
  const auto loopback = find_adapter(*configuration, ipv4(127, 0, 0, 1));
  ASSERT_TRUE(loopback);
  EXPECT_EQ(loopback->state, 1U);
  EXPECT_EQ(loopback->type, "lo");
  EXPECT_EQ(daemon.stop(), 0);
}

TEST(Host, follows_links_and_addresses_as_they_change) {
  if (!enter_own_network()) {
    /* Nothing but a lacking right may be the reason; the machine's own interfaces are not the test's to change. */
    EXPECT_EQ(errno, EPERM);
    return;
  }
  const InterfaceControl control;
  control.set_up("lo", true);
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, {"--socket", directory.path("socket"), "--host"});
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  Connection client(directory.path("socket"));
  const auto before = client.configuration();
  ASSERT_TRUE(before);
  const auto loopback = find_adapter(*before, ipv4(127, 0, 0, 1));
  ASSERT_TRUE(loopback);
  client.subscribe(SubscriptionType::AllAdapters, 7, "all");

  control.set_up("lo", false);
  EXPECT_EQ(wait_for(client, 2, loopback->number), 1U);
  control.set_up("lo", true);
  EXPECT_EQ(wait_for(client, 3, loopback->number), 2U);

  control.add_address("lo:1", "127.9.9.9");
  std::optional<Found> added;
  while (!added) {
    const auto update = wait_for_configuration(client);
    ASSERT_TRUE(update);
    added = find_adapter(*update, ipv4(127, 9, 9, 9));
  }
  EXPECT_EQ(added->state, 1U);
  EXPECT_TRUE(wait_for(client, 3, added->number));

  control.set_up("lo:1", false);
  const auto removed = wait_for(client, 2, added->number);
  ASSERT_TRUE(removed);
  EXPECT_EQ(*removed & 0x08000000U, 0x08000000U);
  const auto after = wait_for_configuration(client);
  ASSERT_TRUE(after);
  EXPECT_FALSE(find_adapter(*after, ipv4(127, 9, 9, 9)));
}

}  // namespace
