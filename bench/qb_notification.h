// A notification through libqb's IPC over shared memory, between two ends in this process.
#pragma once

#include <qb/qbipcc.h>
#include <qb/qbipcs.h>
#include <qb/qbloop.h>

#include <semaphore>
#include <thread>

#include "cluster.h"

namespace bench {

class QbNotification {
 public:
  explicit QbNotification(size_t payload_size);
  ~QbNotification();
  QbNotification(const QbNotification&) = delete;
  QbNotification& operator=(const QbNotification&) = delete;

  void send(const Bytes& payload);

  // Waits for one notification and copies its payload.
  void take();

 private:
  void serve();
  void connect();
  static void keep(qb_ipcs_connection_t* connection);
  static int32_t stop(qb_ipcs_connection_t* connection);

  Bytes sent_;
  Bytes received_;
  qb_loop_t* loop_ = nullptr;
  qb_ipcs_service_t* service_ = nullptr;
  qb_ipcs_connection_t* connection_ = nullptr;
  std::binary_semaphore connected_{0};
  qb_ipcc_connection_t* client_ = nullptr;
  std::jthread server_;  // accepts the one connection, then sleeps until it is closed
};

}  // namespace bench
