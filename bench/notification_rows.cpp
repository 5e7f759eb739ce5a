// One notification, sent and taken with a wait without limit, through the library and through what a program would use
// in its place.
#include <cstring>
#include <memory>

#include "bus_notification.h"
#include "client.h"
#include "hb_protocol/framing.h"
#include "qb_notification.h"
#include "rows.h"

namespace bench {
namespace {

constexpr size_t batch = 32;

// As a daemon sends it: the payload copied behind its length, then one send.
class OurNotification {
 public:
  explicit OurNotification(const Bytes& payload) : client_(peer_), sent_(HB_FRAME_PREFIX_SIZE + payload.size()) {}

  void send(const Bytes& payload) {
    const auto length = static_cast<hb_frame_length>(payload.size());
    std::memcpy(sent_.data(), &length, sizeof length);
    std::memcpy(sent_.data() + sizeof length, payload.data(), payload.size());
    write_all(client_.daemon_end().get(), sent_);
  }

  void take() {
    require(hb_get_event_message(client_.descriptors(), nullptr, &outputs_->events, outputs_->name, &outputs_->group,
                                 &outputs_->sequence_number),
            "hb_get_event_message");
  }

 private:
  Peer peer_{full_size};
  Client client_;
  Bytes sent_;
  std::unique_ptr<Outputs> outputs_ = std::make_unique<Outputs>();
};

template <typename Notification>
Contender sending_and_taking(Notification& notification, const Bytes& payload) {
  return {.prepare = {},
          .run =
              [&notification, &payload] {
                for (size_t sent = 0; sent < batch; ++sent) {
                  notification.send(payload);
                  notification.take();
                }
              },
          .operations = batch};
}

template <typename Other>
void compare_notifications(const Bytes& payload, const Compare& compare) {
  OurNotification ours(payload);
  Other other(payload.size());
  compare(sending_and_taking(ours, payload), sending_and_taking(other, payload));
}

template <typename Other>
void add_notification_row(const char* other, double limit, const char* what, const Bytes& payload) {
  add_row({.name = std::string("notification/") + what, .floor = other, .limit = limit},
          [payload](const Compare& compare) { compare_notifications<Other>(payload, compare); });
}

}  // namespace

void add_notification_rows() {
  constexpr double faster = 1.0;
  constexpr double level = 1.2;
  const Bytes small = failure_data_event(4);
  const Bytes large = node_event(HB_NODE_DEATH, full_size, 700);
  add_notification_row<BusNotification>("sd-bus, direct connection", faster, "112 bytes", small);
  add_notification_row<BusNotification>("sd-bus, direct connection", faster, "8,304 bytes", large);
  add_notification_row<QbNotification>("libqb IPC, shared memory", level, "112 bytes", small);
  add_notification_row<QbNotification>("libqb IPC, shared memory", level, "8,304 bytes", large);
}

}  // namespace bench
