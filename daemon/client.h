/* One connected client. */
#ifndef HBD_CLIENT_H
#define HBD_CLIENT_H

#include <chrono>
#include <string>
#include <utility>

#include "descriptor.h"
#include "frame_reader.h"
#include "loop.h"
#include "output_queue.h"
#include "request_parser.h"
#include "subscription.h"

namespace hbd {

class Client;

/** Who a client belongs to. */
class ClientOwner {
 public:
  ClientOwner() = default;
  ClientOwner(const ClientOwner&) = delete;
  ClientOwner& operator=(const ClientOwner&) = delete;
  virtual ~ClientOwner() = default;
  /** A request came in; it is well formed. */
  virtual void on_request(Client& client, const Request& request) = 0;
  /** Everything that was kept for the client is sent, or the client is disconnected. */
  virtual void on_relief(Client& client) = 0;
  /** Most bytes that are kept for one client. */
  [[nodiscard]] virtual std::size_t queue_bound() const = 0;
  /** Age from which an event is stale. */
  [[nodiscard]] virtual std::chrono::milliseconds stale_age() const = 0;
};

/** A connection: requests come in, packets go out. */
class Client {
 public:
  Client(Loop& loop, Descriptor socket, std::string label, ClientOwner& owner);

  /** Sends an answer, now or when the client reads; disconnects it when it has left too much unread. */
  void send(SharedFrame frame) { push(std::move(frame), {}, std::nullopt); }
  /** Sends an event likewise; it may be dropped when it is stale by then. */
  void tell(SharedFrame frame, const SubscriptionName& name = {}) { push(std::move(frame), name, loop_.now()); }

  /** Ends the connection. */
  void disconnect();

  [[nodiscard]] bool connected() const { return socket_.valid(); }
  /** Whether packets are kept that the client has made no room for. */
  [[nodiscard]] bool is_behind() const { return !output_.empty(); }
  /** How long the client has taken nothing of what is kept for it. */
  [[nodiscard]] std::chrono::milliseconds idle_time() const { return loop_.now() - last_progress_; }
  /** The client for log lines. */
  [[nodiscard]] const std::string& label() const { return label_; }

  SubscriptionList subscriptions;
  bool follows_configuration = false; /**< it has asked for the configuration */
  bool discards_stale = false;        /**< it has asked to be told nothing stale */

 private:
  void push(SharedFrame frame, const SubscriptionName& name, OutputQueue::Time told_at);
  void drop_stale();
  void on_ready(int events);
  void receive();
  void take_requests();
  void flush();
  void settle(OutputQueue::Result result);
  void refuse(const std::string& reason);

  Loop& loop_;
  Descriptor socket_;
  std::string label_;
  ClientOwner& owner_;
  Poll poll_;
  FrameReader input_;
  OutputQueue output_;
  std::chrono::milliseconds last_progress_{};
};

}  // namespace hbd

#endif
