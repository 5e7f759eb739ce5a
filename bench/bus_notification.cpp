#include "bus_notification.h"

#include <sys/socket.h>

#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <string>

#include "descriptor.h"

namespace bench {
namespace {

constexpr const char* object = "/hb/benchmark";
constexpr const char* interface = "hb.benchmark";
constexpr const char* member = "Event";
constexpr uint64_t without_limit = UINT64_MAX;

void require_bus(int result, const char* what) {
  if (result < 0) throw std::runtime_error(std::string(what) + ": " + std::strerror(-result));
}

}  // namespace

BusNotification::BusNotification(size_t payload_size) : received_(payload_size) {
  try {
    connect();
  } catch (...) {
    sd_bus_unref(client_);
    sd_bus_unref(daemon_);
    throw;
  }
}

BusNotification::~BusNotification() {
  sd_bus_close_unref(client_);
  sd_bus_close_unref(daemon_);
}

void BusNotification::connect() {
  int ends[2];
  if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0, ends) != 0) throw_errno("socketpair");
  Descriptor daemon_end(ends[0]);
  Descriptor client_end(ends[1]);
  const sd_id128_t id{{1}};
  require_bus(sd_bus_new(&daemon_), "sd_bus_new");
  require_bus(sd_bus_set_fd(daemon_, daemon_end.get(), daemon_end.get()), "sd_bus_set_fd");
  daemon_end.release();
  require_bus(sd_bus_set_server(daemon_, 1, id), "sd_bus_set_server");
  require_bus(sd_bus_start(daemon_), "sd_bus_start");
  require_bus(sd_bus_new(&client_), "sd_bus_new");
  require_bus(sd_bus_set_fd(client_, client_end.get(), client_end.get()), "sd_bus_set_fd");
  client_end.release();
  require_bus(sd_bus_start(client_), "sd_bus_start");
  require_bus(sd_bus_match_signal(client_, nullptr, nullptr, object, interface, member, copy_payload, this),
              "sd_bus_match_signal");
  while (sd_bus_is_ready(daemon_) <= 0 || sd_bus_is_ready(client_) <= 0) {
    require_bus(sd_bus_process(client_, nullptr), "sd_bus_process");
    require_bus(sd_bus_process(daemon_, nullptr), "sd_bus_process");
  }
}

void BusNotification::send(const Bytes& payload) {
  sd_bus_message* message = nullptr;
  require_bus(sd_bus_message_new_signal(daemon_, &message, object, interface, member), "sd_bus_message_new_signal");
  require_bus(sd_bus_message_append_array(message, 'y', payload.data(), payload.size()), "sd_bus_message_append_array");
  require_bus(sd_bus_send(daemon_, message, nullptr), "sd_bus_send");
  require_bus(sd_bus_flush(daemon_), "sd_bus_flush");
  sd_bus_message_unref(message);
}

void BusNotification::take() {
  require_bus(sd_bus_wait(client_, without_limit), "sd_bus_wait");
  for (const size_t before = taken_; taken_ == before;) require_bus(sd_bus_process(client_, nullptr), "sd_bus_process");
}

int BusNotification::copy_payload(sd_bus_message* message, void* self, sd_bus_error*) {
  auto& notification = *static_cast<BusNotification*>(self);
  const void* bytes = nullptr;
  size_t size = 0;
  const int result = sd_bus_message_read_array(message, 'y', &bytes, &size);
  if (result < 0) return result;
  if (size != notification.received_.size()) return -EBADMSG;
  std::memcpy(notification.received_.data(), bytes, size);
  ++notification.taken_;
  return 1;
}

}  // namespace bench
