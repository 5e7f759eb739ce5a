#include "descriptor.h"

#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

namespace bench {

Descriptor::~Descriptor() { close(); }

Descriptor& Descriptor::operator=(Descriptor&& other) noexcept {
  std::swap(descriptor_, other.descriptor_);
  return *this;
}

void Descriptor::close() {
  if (descriptor_ >= 0) ::close(descriptor_);
  descriptor_ = -1;
}

void throw_errno(const std::string& what) { throw std::system_error(errno, std::generic_category(), what); }

void write_all(int descriptor, const Bytes& bytes) {
  for (size_t written = 0; written < bytes.size();) {
    const ssize_t count = send(descriptor, bytes.data() + written, bytes.size() - written, MSG_NOSIGNAL);
    if (count < 0) throw_errno("send");
    written += static_cast<size_t>(count);
  }
}

bool read_all(int descriptor, char* bytes, size_t size) {
  for (size_t have = 0; have < size;) {
    const ssize_t count = read(descriptor, bytes + have, size - have);
    if (count < 0) throw_errno("read");
    if (count == 0) return false;
    have += static_cast<size_t>(count);
  }
  return true;
}

void make_room(int descriptor, size_t bytes) {
  const auto wanted = static_cast<int>(bytes);
  if (setsockopt(descriptor, SOL_SOCKET, SO_SNDBUFFORCE, &wanted, sizeof wanted) == 0) return;
  if (setsockopt(descriptor, SOL_SOCKET, SO_SNDBUF, &wanted, sizeof wanted) != 0) throw_errno("setsockopt");
}

size_t room(int descriptor) {
  int granted = 0;
  socklen_t size = sizeof granted;
  if (getsockopt(descriptor, SOL_SOCKET, SO_SNDBUF, &granted, &size) != 0) throw_errno("getsockopt");
  return static_cast<size_t>(granted);
}

}  // namespace bench
