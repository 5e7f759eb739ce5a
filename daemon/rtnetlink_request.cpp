#include "rtnetlink_request.h"

#include <linux/rtnetlink.h>
#include <net/if.h>

#include <array>
#include <cerrno>

#include "failure.h"
#include "rtnetlink.h"

namespace hbd {
namespace {

constexpr std::size_t buffer_size = 8192;
constexpr std::size_t mapped_prefix = 12; /* bytes before an IPv4 address */

/* One request with the kernel's answer to it, which comes at once. */
class KernelRequest {
 public:
  KernelRequest(std::uint16_t type, unsigned flags) : message_(mnl_nlmsg_put_header(buffer_.data())) {
    message_->nlmsg_type = type;
    message_->nlmsg_flags = static_cast<std::uint16_t>(NLM_F_REQUEST | NLM_F_ACK | flags);
    message_->nlmsg_seq = 1;
  }

  template <typename Header>
  Header& header() {
    return *static_cast<Header*>(mnl_nlmsg_put_extra_header(message_, sizeof(Header)));
  }

  void put(std::uint16_t attribute, const std::uint8_t* bytes, std::size_t size) {
    mnl_attr_put(message_, attribute, size, bytes);
  }

  int send() try {
    NetlinkSocket socket(0);
    if (mnl_socket_sendto(socket.get(), message_, message_->nlmsg_len) < 0) {
      return errno;
    }
    const ssize_t size = mnl_socket_recvfrom(socket.get(), buffer_.data(), buffer_.size());
    if (size < 0) {
      return errno;
    }
    const int result = mnl_cb_run(buffer_.data(), static_cast<std::size_t>(size), 1,
                                  mnl_socket_get_portid(socket.get()), nullptr, nullptr);
    return result < 0 ? errno : 0;
  } catch (const Failure&) {
    return EMFILE;
  }

 private:
  alignas(nlmsghdr) std::array<char, buffer_size> buffer_{};
  nlmsghdr* message_;
};

int change_address(std::uint16_t type, unsigned flags, const HostAddress& address) {
  KernelRequest request(type, flags);
  const bool four = address.is_ipv4();
  auto& header = request.header<ifaddrmsg>();
  header.ifa_family = four ? AF_INET : AF_INET6;
  header.ifa_prefixlen = address.prefix_length;
  header.ifa_index = static_cast<std::uint32_t>(address.interface);
  const std::size_t skipped = four ? mapped_prefix : 0;
  request.put(IFA_LOCAL, address.bytes.data() + skipped, address.bytes.size() - skipped);
  request.put(IFA_ADDRESS, address.bytes.data() + skipped, address.bytes.size() - skipped);
  return request.send();
}

}  // namespace

int switch_link(int interface, bool on) {
  KernelRequest request(RTM_NEWLINK, 0);
  auto& header = request.header<ifinfomsg>();
  header.ifi_index = interface;
  header.ifi_flags = on ? IFF_UP : 0;
  header.ifi_change = IFF_UP;
  return request.send();
}

int add_address(const HostAddress& address) { return change_address(RTM_NEWADDR, NLM_F_CREATE | NLM_F_EXCL, address); }

int remove_address(const HostAddress& address) { return change_address(RTM_DELADDR, 0, address); }

}  // namespace hbd
