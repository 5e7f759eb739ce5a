#include "server.h"

#include <fcntl.h>
#include <spdlog/spdlog.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include "failure.h"
#include "packet_writer.h"

namespace hbd {
namespace {

/* A client that takes nothing for so long is not waited for by anybody. */
constexpr std::chrono::seconds patience{5};

Descriptor spare_descriptor() { return Descriptor(open("/dev/null", O_RDONLY | O_CLOEXEC)); }

/* What the client's library takes no subscription to goes to whoever has asked for the configuration. */
bool concerns_every_client(const Event& event) {
  return std::holds_alternative<ConfigurationEvent>(event.body) || std::holds_alternative<FailureData>(event.body);
}

std::string label_of(unsigned long number, int socket) {
  ucred peer{};
  socklen_t size = sizeof(peer);
  if (getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0) {
    return fmt::format("client {}", number);
  }
  return fmt::format("client {} (process {})", number, peer.pid);
}

}  // namespace

Server::Server(Loop& loop, int listening, RequestCallback on_request)
    : loop_(loop),
      listening_(listening),
      on_request_(std::move(on_request)),
      spare_(spare_descriptor()),
      poll_(loop, listening, [this](int) { accept_all(); }),
      after_input_(loop, [this] { forget_disconnected(); }) {
  poll_.watch(UV_READABLE);
}

void Server::deliver(const Event& event, const Cluster& cluster) {
  SharedFrame frame;
  const auto bytes = [&] {
    if (!frame) {
      frame = event_frame(event, cluster);
    }
    return frame;
  };
  const bool by_client = concerns_every_client(event);
  for (const auto& client : clients_) {
    bool told = false;
    for (const auto& subscription : client->subscriptions) {
      if (subscription.wants(event, cluster)) {
        client->tell(bytes(), subscription.name);
        told = true;
      }
    }
    if (by_client && !told && client->follows_configuration) {
      client->tell(bytes());
    }
  }
}

std::size_t Server::clients() const {
  return static_cast<std::size_t>(
      std::count_if(clients_.begin(), clients_.end(), [](const auto& client) { return client->connected(); }));
}

std::size_t Server::subscriptions() const {
  std::size_t sum = 0;
  for (const auto& client : clients_) {
    sum += client->connected() ? client->subscriptions.size() : 0;
  }
  return sum;
}

bool Server::has_read() const {
  return std::none_of(clients_.begin(), clients_.end(), [](const auto& client) {
    return client->connected() && client->is_behind() && client->idle_time() < patience;
  });
}

void Server::accept_all() {
  while (accept_one()) {
  }
}

bool Server::accept_one() {
  Descriptor socket(accept4(listening_, nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC));
  if (socket.valid()) {
    add(std::move(socket));
    return true;
  }
  if (errno == EMFILE || errno == ENFILE) {
    turn_away();
    return false;
  }
  return errno == EINTR || errno == ECONNABORTED;
}

void Server::turn_away() {
  spare_.close();
  const Descriptor unwanted(accept4(listening_, nullptr, nullptr, SOCK_CLOEXEC));
  if (unwanted.valid()) {
    spdlog::error("a client was turned away: no descriptor is free, with {} clients; raise the limit (ulimit -n)",
                  clients_.size());
  }
  spare_ = spare_descriptor();
}

void Server::add(Descriptor socket) {
  std::string label = label_of(++last_number_, socket.get());
  spdlog::debug("{}: has connected", label);
  try {
    clients_.push_back(std::make_unique<Client>(loop_, std::move(socket), std::move(label), *this));
  } catch (const Failure& failure) {
    spdlog::error("a client was turned away: {}", failure.what());
  }
}

void Server::forget_disconnected() {
  if (std::exchange(some_left_, false)) {
    std::erase_if(clients_, [](const auto& client) { return !client->connected(); });
  }
  if (clients_.empty() && when_alone_) {
    std::exchange(when_alone_, nullptr)();
  }
}

void Server::on_request(Client& client, const Request& request) {
  on_request_(client, request);
  changed_();
}

void Server::on_relief(Client& client) {
  some_left_ = some_left_ || !client.connected();
  changed_();
}

}  // namespace hbd
