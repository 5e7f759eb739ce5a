#include "peer.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <cstring>
#include <stdexcept>

#include "hb_protocol/framing.h"
#include "hb_protocol/requests.h"

namespace bench {
namespace {

constexpr size_t wanted_room = 16U << 20;  // more than the largest packet with what the system adds to it

// At most so much of the room is used by one packet.
size_t room_of_one(const Bytes& packet) { return 2 * packet.size() + 2048; }

Descriptor listen_at(const std::string& path) {
  Descriptor listener(socket(AF_UNIX, SOCK_STREAM, 0));
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.size() >= sizeof address.sun_path) throw std::runtime_error("socket path too long: " + path);
  std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
  if (bind(listener.get(), reinterpret_cast<sockaddr*>(&address), sizeof address) != 0) throw_errno("bind " + path);
  if (listen(listener.get(), SOMAXCONN) != 0) throw_errno("listen " + path);
  return listener;
}

void skip_request(int end) {
  hb_frame_length length = 0;
  if (!read_all(end, reinterpret_cast<char*>(&length), sizeof length)) throw std::runtime_error("no request came");
  Bytes request(static_cast<size_t>(length));
  if (!read_all(end, request.data(), request.size())) throw std::runtime_error("the request ended early");
}

}  // namespace

Peer::Peer(const Cluster& cluster)
    : socket_path_(directory_.path() + "/socket"),
      listener_(listen_at(socket_path_)),
      segments_(socket_path_, cluster),
      configuration_(framed(configuration(HB_CONFIGURATION_INFO, cluster))) {}

Descriptor Peer::accept() const {
  Descriptor end(::accept(listener_.get(), nullptr, nullptr));
  if (end.get() < 0) throw_errno("accept");
  make_room(end.get(), wanted_room);
  return end;
}

Descriptor Peer::accept_and_answer() const {
  Descriptor end = accept();
  skip_request(end.get());
  write_all(end.get(), configuration_);
  return end;
}

void Feed::feed(const Bytes& bytes, size_t times) {
  if (sender_.joinable()) sender_.join();
  const auto send_all = [this, &bytes, times] {
    for (size_t sent = 0; sent < times; ++sent) write_all(end_.get(), bytes);
  };
  if (times * room_of_one(bytes) <= room(end_.get())) {
    send_all();
  } else {
    sender_ = std::jthread(send_all);
  }
}

}  // namespace bench
