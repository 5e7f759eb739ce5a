/* The daemon as a whole: source, model, published memory and clients, put together. */
#ifndef HBD_DAEMON_H
#define HBD_DAEMON_H

#include <memory>
#include <string>

#include "change.h"
#include "claim.h"
#include "cluster.h"
#include "key_ring.h"
#include "loop.h"
#include "membership_source.h"
#include "request_handler.h"
#include "routes.h"
#include "server.h"
#include "service_settings.h"

namespace hbd {

/** One daemon at one socket path. */
class Daemon : public ChangeSink {
 public:
  /**
   * Listens from here on, and answers once the loop runs.
   *
   * @param queue_bytes bytes that are kept for a client that does not read; two configurations are always kept.
   * @throws Failure when the path or a key cannot be had.
   */
  Daemon(Loop& loop, const std::string& path, MembershipSource& source, std::size_t queue_bytes,
         const ServiceSettings& settings = {});

  /** Makes a change to the cluster, publishes it and tells the clients. */
  void apply(const Change& change) override;

  /** Has a new security key published. A key file that cannot be used is reported, and the key stays. */
  void rotate_keys();

  /** The clients. */
  Server& server() { return server_; }
  [[nodiscard]] const Cluster& cluster() const { return cluster_; }

 private:
  [[nodiscard]] Publication publication();
  void schedule_rotation();
  void keep_room_for_configurations();

  std::size_t queue_bytes_;
  Cluster cluster_;
  RouteTable routes_;
  RequestHandler handler_;
  KeyRing keys_;
  Claim claim_;
  Server server_;
  std::chrono::milliseconds key_rotation_;
  Timer rotation_;
};

}  // namespace hbd

#endif
