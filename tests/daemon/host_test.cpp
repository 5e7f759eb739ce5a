/* The daemon that follows this host, in a network of the test's own where that is allowed. */
#include <gmock/gmock.h>

#include "daemon_process.h"
#include "host_network.h"
#include "wire.h"

namespace {

TEST(Host, lists_the_loopback_interface_as_an_adapter_that_is_up) {
  if (enter_own_network()) {
    Interfaces().set_up("lo", true);
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
    return; /* the machine's own interfaces are not the test's to change */
  }
  const Interfaces control;
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

  control.set_address("lo:1", "127.9.9.9");
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
