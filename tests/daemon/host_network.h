/* A network of a test's own, and what the daemon tells of it. */
#ifndef HB_TESTS_DAEMON_HOST_NETWORK_H
#define HB_TESTS_DAEMON_HOST_NETWORK_H

#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <linux/capability.h>
#include <linux/sockios.h>
#include <net/if.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <optional>
#include <string>

#include "wire.h"

inline void write_to(const char* file, const std::string& text) { std::ofstream(file) << text; }

/**
 * Moves this process, and what it starts, into a network that has nothing but a loopback interface, with the right to
 * change it. False where that is not allowed.
 */
inline bool enter_own_network() {
  if (unshare(CLONE_NEWNET) == 0) {
    return true;
  }
  const std::string user = std::to_string(geteuid());
  const std::string group = std::to_string(getegid());
  if (unshare(CLONE_NEWUSER | CLONE_NEWNET) != 0) {
    /* Nothing but a lacking right may be the reason, or a limit that stands for one. */
    EXPECT_TRUE(errno == EPERM || errno == ENOSPC) << std::strerror(errno);
    return false;
  }
  /* A program that is started keeps the right as the user 0 only. */
  write_to("/proc/self/setgroups", "deny");
  write_to("/proc/self/uid_map", "0 " + user + " 1");
  write_to("/proc/self/gid_map", "0 " + group + " 1");
  return true;
}

/** From here on neither this thread nor what it starts can change a network. */
inline void give_up_the_right_to_networks() {
  __user_cap_header_struct header{_LINUX_CAPABILITY_VERSION_3, 0};
  std::array<__user_cap_data_struct, 2> rights{};
  ASSERT_EQ(prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0), 0);
  ASSERT_EQ(syscall(SYS_capget, &header, rights.data()), 0);
  constexpr std::uint32_t others = ~(1U << CAP_NET_ADMIN);
  rights[0].effective &= others;
  rights[0].permitted &= others;
  rights[0].inheritable &= others;
  ASSERT_EQ(syscall(SYS_capset, &header, rights.data()), 0);
}

/** Looks at interfaces and changes them, by ioctl. */
class Interfaces {
 public:
  Interfaces() = default;
  Interfaces(const Interfaces&) = delete;
  Interfaces& operator=(const Interfaces&) = delete;
  ~Interfaces() { close(socket_); }

  void set_up(const char* name, bool up) const {
    ifreq request = named(name);
    ASSERT_EQ(ioctl(socket_, SIOCGIFFLAGS, &request), 0) << std::strerror(errno);
    request.ifr_flags = static_cast<short>(up ? request.ifr_flags | IFF_UP : request.ifr_flags & ~IFF_UP);
    ASSERT_EQ(ioctl(socket_, SIOCSIFFLAGS, &request), 0) << std::strerror(errno);
  }

  /* A classful prefix comes with it. The unspecified address takes away the one that is there. */
  void set_address(const char* alias, const char* address) const {
    ifreq request = named(alias);
    auto& field = reinterpret_cast<sockaddr_in&>(request.ifr_addr);
    field.sin_family = AF_INET;
    inet_pton(AF_INET, address, &field.sin_addr);
    ASSERT_EQ(ioctl(socket_, SIOCSIFADDR, &request), 0) << std::strerror(errno);
  }

  [[nodiscard]] std::string address(const char* name) const { return text_of(SIOCGIFADDR, name); }
  [[nodiscard]] std::string mask(const char* name) const { return text_of(SIOCGIFNETMASK, name); }

  /* An interface of its own, without a carrier. False where the kernel has no such thing. */
  [[nodiscard]] bool add_bridge(const char* name) const { return ioctl(socket_, SIOCBRADDBR, name) == 0; }

 private:
  static ifreq named(const char* name) {
    ifreq request{};
    std::strncpy(request.ifr_name, name, IFNAMSIZ - 1);
    return request;
  }

  /* The first IPv4 address of an interface, or its mask; nothing when there is none. */
  [[nodiscard]] std::string text_of(unsigned long what, const char* name) const {
    ifreq request = named(name);
    std::array<char, INET_ADDRSTRLEN> text{};
    if (ioctl(socket_, what, &request) == 0) {
      const auto& field = reinterpret_cast<const sockaddr_in&>(request.ifr_addr);
      inet_ntop(AF_INET, &field.sin_addr, text.data(), text.size());
    }
    return text.data();
  }

  int socket_ = socket(AF_INET, SOCK_DGRAM, 0);
};

/** The adapter record of an IPv4 address in a configuration message; its number and state. */
struct Found {
  std::uint32_t number;
  std::uint32_t state;
  std::string type;
};

inline std::optional<Found> find_adapter(const Bytes& configuration, const Bytes& address) {
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

inline Bytes ipv4(unsigned a, unsigned b, unsigned c, unsigned d) {
  return ByteWriter().zeros(10).u8(0xFF).u8(0xFF).u8(a).u8(b).u8(c).u8(d).bytes();
}

/** The incarnation that an event of a kind gives for an adapter, once such an event comes. */
inline std::optional<std::uint32_t> wait_for(Connection& client, std::uint32_t kind, std::uint32_t adapter) {
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

inline std::optional<Bytes> wait_for_configuration(Connection& client) {
  auto packet = client.receive();
  while (packet && field(*packet, 0) != 9) {
    packet = client.receive();
  }
  return packet;
}

#endif
