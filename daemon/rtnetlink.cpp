#include "rtnetlink.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <linux/rtnetlink.h>
#include <spdlog/spdlog.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <string_view>

#include "failure.h"

namespace hbd {
namespace {

constexpr unsigned watched = RTMGRP_LINK | RTMGRP_IPV4_IFADDR | RTMGRP_IPV6_IFADDR;
constexpr std::size_t buffer_size = 65536;
constexpr int most_attempts = 16;

Failure failure(std::string_view what) {
  return Failure(fmt::format("{} failed: {}; this host cannot be followed, use --scenario instead of --host", what,
                             std::strerror(errno)));
}

int take_message(const nlmsghdr* message, void* table) {
  static_cast<HostTable*>(table)->take(*message);
  return MNL_CB_OK;
}

/* Asks for all links or all addresses; false when they changed meanwhile. */
bool dump(std::uint16_t type, HostTable& table) {
  NetlinkSocket socket(0);
  std::array<char, buffer_size> buffer;
  nlmsghdr* request = mnl_nlmsg_put_header(buffer.data());
  request->nlmsg_type = type;
  request->nlmsg_flags = NLM_F_REQUEST | NLM_F_DUMP;
  request->nlmsg_seq = 1;
  mnl_nlmsg_put_extra_header(request, sizeof(rtgenmsg));
  if (mnl_socket_sendto(socket.get(), request, request->nlmsg_len) < 0) {
    throw failure("asking the kernel for its interfaces");
  }
  int state = MNL_CB_OK;
  while (state == MNL_CB_OK) {
    const ssize_t size = mnl_socket_recvfrom(socket.get(), buffer.data(), buffer.size());
    if (size < 0) {
      throw failure("reading the kernel's interfaces");
    }
    state = mnl_cb_run(buffer.data(), static_cast<std::size_t>(size), request->nlmsg_seq,
                       mnl_socket_get_portid(socket.get()), take_message, &table);
  }
  if (state < 0 && errno != EINTR) {
    throw failure("reading the kernel's interfaces");
  }
  return state == MNL_CB_STOP;
}

}  // namespace

NetlinkSocket::NetlinkSocket(unsigned groups) : socket_(mnl_socket_open2(NETLINK_ROUTE, SOCK_CLOEXEC)) {
  if (socket_ == nullptr) {
    throw failure("opening a netlink socket");
  }
  if (mnl_socket_bind(socket_, groups, MNL_SOCKET_AUTOPID) < 0) {
    const Failure reason = failure("binding a netlink socket");
    mnl_socket_close(socket_);
    throw reason;
  }
}

NetlinkSocket::~NetlinkSocket() { mnl_socket_close(socket_); }

HostMonitor::HostMonitor() : changes_(watched) {
  const int flags = fcntl(changes_.descriptor(), F_GETFL);
  fcntl(changes_.descriptor(), F_SETFL, flags | O_NONBLOCK);
}

HostTable HostMonitor::read_all() {
  for (int i = 0; i < most_attempts; ++i) {
    HostTable table;
    if (dump(RTM_GETLINK, table) && dump(RTM_GETADDR, table)) {
      return table;
    }
  }
  errno = EINTR;
  throw failure("reading the kernel's interfaces without a change in between");
}

void HostMonitor::take_all(HostTable& table) {
  std::array<char, buffer_size> buffer;
  for (;;) {
    const ssize_t size = mnl_socket_recvfrom(changes_.get(), buffer.data(), buffer.size());
    if (size < 0 && errno == ENOBUFS) {
      spdlog::debug("messages of the kernel were lost; its interfaces are read anew");
      table = read_all();
      continue;
    }
    if (size <= 0) {
      return;
    }
    mnl_cb_run(buffer.data(), static_cast<std::size_t>(size), 0, 0, take_message, &table);
  }
}

}  // namespace hbd
