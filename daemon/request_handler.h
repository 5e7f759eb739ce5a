/* What each request does. */
#ifndef HBD_REQUEST_HANDLER_H
#define HBD_REQUEST_HANDLER_H

#include "client.h"
#include "cluster.h"
#include "frame.h"

namespace hbd {

/** Answers requests from the cluster as it stands. */
class RequestHandler {
 public:
  explicit RequestHandler(const Cluster& cluster) : cluster_(cluster) {}

  /** Serves one well-formed request. */
  void handle(Client& client, const Request& request);

  /** Bytes of the answer to a request for the configuration, length included. */
  [[nodiscard]] std::size_t configuration_size();

 private:
  void serve(Client& client, const PlainRequest& request);
  void serve(Client& client, const SubscribeRequest& request);
  void serve(Client& client, const UnsubscribeRequest& request);
  void serve(Client& client, const MalformedRequest& request);
  const SharedFrame& configuration();

  const Cluster& cluster_;
  SharedFrame configuration_;
  Hb_Seq_Num configuration_stands_for_ = 0; /* number of the last event that the frame knows of */
};

}  // namespace hbd

#endif
