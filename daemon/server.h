/* The clients: accepting them, and telling them events. */
#ifndef HBD_SERVER_H
#define HBD_SERVER_H

#include <functional>
#include <memory>
#include <vector>

#include "audience.h"
#include "client.h"
#include "cluster.h"
#include "descriptor.h"
#include "loop.h"

namespace hbd {

/** Serves every client that connects to one listening socket. */
class Server : public Audience, public ClientOwner {
 public:
  using RequestCallback = std::function<void(Client&, const Request&)>;

  /**
   * @param listening a socket that listens; it stays the caller's.
   * @param on_request called with every well-formed request.
   */
  Server(Loop& loop, int listening, RequestCallback on_request);

  /** Sends the event to everybody who wants it. */
  void deliver(const Event& event, const Cluster& cluster);

  /** Sets how many bytes are kept for a client that does not read. */
  void set_queue_bound(std::size_t bytes) { queue_bound_ = bytes; }

  /** Sets the age from which events are dropped for clients that have asked for it. */
  void set_stale_age(std::chrono::milliseconds age) { stale_age_ = age; }

  /** Calls once, as soon as the last client has left. */
  void when_alone(std::function<void()> callback) { when_alone_ = std::move(callback); }

  [[nodiscard]] std::size_t clients() const;
  [[nodiscard]] std::size_t subscriptions() const override;
  [[nodiscard]] bool has_read() const override;
  void on_change(std::function<void()> callback) override { changed_ = std::move(callback); }

 private:
  void accept_all();
  bool accept_one();
  void turn_away();
  void add(Descriptor socket);
  void forget_disconnected();
  void on_request(Client& client, const Request& request) override;
  void on_relief(Client& client) override;
  [[nodiscard]] std::size_t queue_bound() const override { return queue_bound_; }
  [[nodiscard]] std::chrono::milliseconds stale_age() const override { return stale_age_; }

  Loop& loop_;
  int listening_;
  RequestCallback on_request_;
  std::function<void()> changed_ = [] {};
  std::function<void()> when_alone_;
  std::size_t queue_bound_ = 0;
  std::chrono::milliseconds stale_age_{10000};
  Descriptor spare_; /* given up for a moment to turn a client away when descriptors run out */
  unsigned long last_number_ = 0;
  bool some_left_ = false;
  std::vector<std::unique_ptr<Client>> clients_;
  Poll poll_;
  AfterInput after_input_;
};

}  // namespace hbd

#endif
