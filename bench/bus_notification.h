// A notification through sd-bus, on a direct connection between two ends in this process.
#pragma once

#include <systemd/sd-bus.h>

#include "cluster.h"

namespace bench {

class BusNotification {
 public:
  explicit BusNotification(size_t payload_size);
  ~BusNotification();
  BusNotification(const BusNotification&) = delete;
  BusNotification& operator=(const BusNotification&) = delete;

  void send(const Bytes& payload);

  // Waits for one notification and copies its payload.
  void take();

 private:
  void connect();
  static int copy_payload(sd_bus_message* message, void* self, sd_bus_error* error);

  sd_bus* daemon_ = nullptr;
  sd_bus* client_ = nullptr;
  Bytes received_;
  size_t taken_ = 0;
};

}  // namespace bench
