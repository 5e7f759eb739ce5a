#include "support/system.h"

#include <poll.h>
#include <sys/ipc.h>
#include <sys/mman.h>
#include <sys/select.h>
#include <sys/sem.h>
#include <sys/shm.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include <climits>
#include <new>

#include "hb_protocol/framing.h"
#include "support/require.h"

namespace fuzz {

System the_system = {{}, {}, {}, 1U << 24U, 0, 0, 0, {1, 1, 1}, sizeof(route_sequence), {}, {}};

unsigned System::next_fault(unsigned& detail) {
  if (script.empty()) {
    detail = 0;
    return 0;
  }
  const unsigned byte = script.front();
  script = script.subspan(1);
  detail = byte >> 4U;
  return byte & 15U;
}

namespace {

constexpr int no_fault = 0;

// Errors by number of fault. Each call adds meanings of its own above them.
template <size_t N>
bool fails(unsigned fault, const int (&errors)[N]) {
  if (fault == no_fault || fault > N) {
    return false;
  }
  errno = errors[fault - 1];
  return true;
}

template <size_t N>
bool fails(const int (&errors)[N]) {
  unsigned detail = 0;
  return fails(the_system.next_fault(detail), errors);
}

size_t length_of(const iovec* vectors, int count) {
  size_t length = 0;
  for (int i = 0; i < count; ++i) {
    length += vectors[i].iov_len;
  }
  return length;
}

void record_sent(const iovec* vectors, int count) {
  Sent& sent = the_system.sent;
  sent.length = 0;
  for (int i = 0; i < count; ++i) {
    const size_t room = sent.front.size() - std::min(sent.length, sent.front.size());
    const size_t kept = std::min(room, vectors[i].iov_len);
    if (kept > 0) {
      std::memcpy(sent.front.data() + sent.length, vectors[i].iov_base, kept);
    }
    sent.length += vectors[i].iov_len;
  }
}

ssize_t take_from_stream(void* buffer, size_t length) {
  const size_t count = std::min(length, the_system.stream.size());
  if (count > 0) {
    std::memcpy(buffer, the_system.stream.data(), count);
    the_system.stream = the_system.stream.subspan(count);
  }
  return static_cast<ssize_t>(count);
}

struct Segment {
  void* address;
  size_t size;
};

Segment segment(int id) {
  switch (id) {
    case HB_CONFIGURATION_SEGMENT_ID:
      return {&the_system.configuration, sizeof the_system.configuration};
    case HB_ROUTE_SEGMENT_ID:
      return {the_system.route_segment.data(), the_system.route_segment_size};
    case HB_SECURITY_SEGMENT_ID:
      return {&the_system.security, sizeof the_system.security};
    default:
      fuzz::broken("the segment is one of the three", __FILE__, __LINE__);
  }
}

constexpr int read_errors[] = {EINTR, EAGAIN, EIO, EFAULT, ECONNRESET};
constexpr unsigned end_of_file = 6;
constexpr unsigned short_transfer = 7;  // and above: one byte more than the detail says
constexpr int select_errors[] = {EINTR, EAGAIN, EBADF, EINVAL, EFAULT, ENOMEM};
constexpr unsigned time_is_over = 7;
constexpr int write_errors[] = {EINTR, EAGAIN, EIO, EFAULT, EPIPE};
constexpr unsigned nothing_written = 6;
constexpr int socket_errors[] = {EMFILE};
constexpr int connect_errors[] = {ECONNREFUSED, ENOENT};
constexpr int key_errors[] = {ENOENT};
constexpr int semaphore_errors[] = {EINTR, EIDRM, EINVAL, EACCES};
constexpr int ipc_errors[] = {EACCES, EINVAL, ENOENT, ENOMEM, ENOSPC, EMFILE, ENFILE};

}  // namespace
}  // namespace fuzz

using fuzz::fails;
using fuzz::the_system;

// The linker puts these in the place of the system's calls.
extern "C" {

ssize_t __real_read(int fd, void* buffer, size_t length);
int __real_close(int fd);

ssize_t __wrap_read(int fd, void* buffer, size_t length) {
  if (fd != fuzz::descriptor) {
    return __real_read(fd, buffer, length);
  }
  unsigned detail = 0;
  const unsigned fault = the_system.next_fault(detail);
  if (fails(fault, fuzz::read_errors)) {
    return -1;
  }
  if (fault == fuzz::end_of_file) {
    return 0;
  }
  return fuzz::take_from_stream(buffer, fault >= fuzz::short_transfer ? std::min<size_t>(length, detail + 1) : length);
}

// new (std::nothrow) of an array.
void* __real__ZnamRKSt9nothrow_t(size_t size, const std::nothrow_t& tag);
void* __wrap__ZnamRKSt9nothrow_t(size_t size, const std::nothrow_t& tag) {
  return size <= the_system.largest_array ? __real__ZnamRKSt9nothrow_t(size, tag) : nullptr;
}

int __wrap_close(int fd) {
  if (fd != fuzz::descriptor) {
    return __real_close(fd);
  }
  --the_system.open_connections;
  return 0;
}

int __wrap_select(int count, fd_set* readable, fd_set* writable, fd_set* exceptional, timeval* /*timeout*/) {
  REQUIRE(count == FD_SETSIZE);
  unsigned detail = 0;
  const unsigned fault = the_system.next_fault(detail);
  if (fails(fault, fuzz::select_errors)) {
    return -1;
  }
  FD_ZERO(writable);
  FD_ZERO(exceptional);
  if (fault == fuzz::time_is_over) {
    FD_ZERO(readable);
    return 0;
  }
  return FD_ISSET(fuzz::descriptor, readable) ? 1 : 0;
}

int __wrap_poll(pollfd* /*descriptors*/, nfds_t count, int /*timeout*/) { return static_cast<int>(count); }

ssize_t __wrap_writev(int fd, const iovec* vectors, int count) {
  REQUIRE(fd == fuzz::descriptor);
  unsigned detail = 0;
  const unsigned fault = the_system.next_fault(detail);
  if (count < 0 || count > IOV_MAX) {
    errno = EINVAL;
    return -1;
  }
  if (fails(fault, fuzz::write_errors)) {
    return -1;
  }
  if (fault == fuzz::nothing_written) {
    return 0;
  }
  fuzz::record_sent(vectors, count);
  const size_t length = fuzz::length_of(vectors, count);
  return static_cast<ssize_t>(fault >= fuzz::short_transfer ? std::min<size_t>(length, detail + 1) : length);
}

int __wrap_socket(int /*domain*/, int /*type*/, int /*protocol*/) {
  if (fails(fuzz::socket_errors)) {
    return -1;
  }
  ++the_system.open_connections;
  return fuzz::descriptor;
}

int __wrap_setsockopt(int /*fd*/, int /*level*/, int /*name*/, const void* /*value*/, socklen_t /*length*/) {
  return fails(fuzz::socket_errors) ? -1 : 0;
}

int __wrap_connect(int /*fd*/, const sockaddr* /*address*/, socklen_t /*length*/) {
  return fails(fuzz::connect_errors) ? -1 : 0;
}

pid_t __wrap_getpid() { return 4711; }

// The project id is key, segment and semaphore set at once.
key_t __wrap_ftok(const char* /*path*/, int project_id) { return fails(fuzz::key_errors) ? -1 : project_id; }

int __wrap_shmget(key_t key, size_t size, int flags) {
  REQUIRE(flags == 0);
  if (fails(fuzz::ipc_errors)) {
    return -1;
  }
  if (size > fuzz::segment(key).size) {
    errno = EINVAL;
    return -1;
  }
  return key;
}

void* __wrap_shmat(int id, const void* address, int flags) {
  REQUIRE(address == nullptr && flags == SHM_RDONLY);
  if (fails(fuzz::ipc_errors)) {
    return MAP_FAILED;
  }
  ++the_system.attached_segments;
  return fuzz::segment(id).address;
}

int __wrap_shmdt(const void* /*address*/) {
  --the_system.attached_segments;
  return 0;
}

int __wrap_semget(key_t key, int count, int flags) {
  REQUIRE(key == HB_SEMAPHORE_SET_ID && count == HB_SEMAPHORE_COUNT && flags == 0);
  return fails(fuzz::ipc_errors) ? -1 : key;
}

// A reader goes in when nobody writes, and out again. Nobody writes here.
int __wrap_semop(int id, sembuf* operations, size_t count) {
  REQUIRE(id == HB_SEMAPHORE_SET_ID && (count == 1 || count == 2));
  REQUIRE(operations[0].sem_num == HB_READERS_SEMAPHORE && operations[0].sem_op == (count == 2 ? 1 : -1));
  REQUIRE(operations[0].sem_flg == SEM_UNDO);
  REQUIRE(count == 1 || (operations[1].sem_num == HB_WRITER_SEMAPHORE && operations[1].sem_op == 0));
  if (fails(fuzz::semaphore_errors)) {
    the_system.readers = errno == EINTR ? the_system.readers : 0;  // the set has gone, and its readers with it
    return -1;
  }
  the_system.readers += operations[0].sem_op;
  REQUIRE(the_system.readers == 0 || the_system.readers == 1);
  return 0;
}

}  // extern "C"
