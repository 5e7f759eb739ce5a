#include "subscriber.h"

#include <sys/resource.h>
#include <sys/socket.h>

#include <cerrno>
#include <cstring>

#include "hb_client/events.h"
#include "hb_client/subscription.h"
#include "hb_protocol/requests.h"

namespace bench {
namespace {

constexpr int longest_wait = 10;  // seconds

template <typename Field>
void put(Bytes& bytes, size_t offset, const Field& field) {
  std::memcpy(bytes.data() + offset, &field, sizeof field);
}

Bytes subscription_request(Hb_Events events) {
  Hb_Subscription_Group group{};
  group.Hb_subscription_type = Hb_All_Adapters_Subscription;
  group.Hb_events = events;
  std::memcpy(group.Hb_name, "benchmark", sizeof "benchmark");
  Bytes request(HB_REQUEST_HEADER_SIZE + sizeof group);
  put(request, offsetof(packet_str, kind), static_cast<int32_t>(HB_SUBSCRIBE));
  put(request, offsetof(packet_str, len), static_cast<int32_t>(sizeof group));
  put(request, HB_REQUEST_HEADER_SIZE, group);
  return framed(request);
}

}  // namespace

void drain(int descriptor) {
  static Bytes room(1U << 20);
  while (recv(descriptor, room.data(), room.size(), MSG_DONTWAIT) > 0) {
  }
  if (errno != EAGAIN && errno != EWOULDBLOCK) throw_errno("recv");
}

Subscribers::Subscribers(const std::string& socket_path, size_t count, Hb_Events events) {
  Bytes request = subscription_request(events);
  for (size_t made = 0; made < count; ++made) {
    clients_.emplace_back(socket_path);
    clients_.back().send(request);
  }
}

void Subscribers::drain_all() const {
  for (const BareClient& client : clients_) drain(client.descriptor());
}

void Subscribers::await_all() const {
  for (const BareClient& client : clients_) wait_for(client.descriptor(), Wait::poll, longest_wait);
}

void raise_descriptor_limit(size_t connections) {
  rlimit limit{};
  const rlim_t wanted = 2 * connections + 100;
  if (getrlimit(RLIMIT_NOFILE, &limit) != 0) throw_errno("getrlimit");
  if (limit.rlim_cur >= wanted) return;
  limit.rlim_cur = wanted;
  if (setrlimit(RLIMIT_NOFILE, &limit) != 0) throw_errno("raising the limit of descriptors (ulimit -n)");
}

}  // namespace bench
