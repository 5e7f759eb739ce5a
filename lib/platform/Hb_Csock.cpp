#include "platform/Hb_Csock.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdio>
#include <cstring>
#include <memory>
#include <new>

#include "hb_communication/connection.h"
#include "hb_global_data/state.h"
#include "hb_protocol/framing.h"
#include "platform/Hb_Select.h"

namespace {

// Level of the interface that this source implements; nothing reads it.
[[maybe_unused]] constexpr int Hb_CsockMajorVersion = 1;
[[maybe_unused]] constexpr int Hb_CsockMinorVersion = 0;

constexpr timeval receive_retry_time = {5, 0};  // longest wait between two attempts of a read that would block
constexpr int vector_capacity = 2;              // prefix and message

static_assert(sizeof(sockaddr_un::sun_path) == HB_SOCKET_PATH_SIZE);
static_assert(sizeof(hb_frame_length) == HB_FRAME_PREFIX_SIZE);

bool set_buffer_size(int sock, int option) {
  const int size = HB_SOCKET_BUFFER_SIZE;
  return setsockopt(sock, SOL_SOCKET, option, &size, sizeof size) == 0;
}

// The vector that a write of n bytes ended exactly with, empty ones behind it included; count when it ended inside one.
int vector_of_end(const iovec* vectors, int count, ssize_t n) {
  for (int i = 0; i < count; ++i) {
    n -= static_cast<ssize_t>(vectors[i].iov_len);
    if (n == 0) {
      while (i + 1 < count && vectors[i + 1].iov_len == 0) {
        ++i;
      }
      return i;
    }
  }
  return count;
}

// Waits until sock is readable or the retry time is over; both mean another attempt.
bool may_read_again(int sock) {
  Hb_Select selector;
  selector.rd_set(sock);
  selector.timeout(receive_retry_time);
  return selector.wait() == Hb_Success || selector.Error() == Hb_Select_EAGAIN;
}

}  // namespace

Hb_Csock::Hb_Csock() : sock(-1), socket_eof(Hb_False), socket_un{}, myError(Hb_Csock_NO_ERROR) { open_and_connect(); }

Hb_Csock::~Hb_Csock() { close(sock); }

Hb_Rc Hb_Csock::stop_opening(int32_t socket_error, int library_error) {
  myError = socket_error;
  return fail(library_error);
}

Hb_Rc Hb_Csock::open_and_connect() {
  std::snprintf(socket_un.sun_path, sizeof socket_un.sun_path, "%s", SERVER_SOCK_FNAME);
  sock = ::socket(AF_UNIX, SOCK_STREAM, 0);
  if (sock < 0) {
    return stop_opening(Hb_Csock_OPEN_FAILURE, HB_ESOCKET);
  }
  if (!set_buffer_size(sock, SO_SNDBUF) || !set_buffer_size(sock, SO_RCVBUF)) {
    return stop_opening(Hb_Csock_OPT_FAILURE, HB_ESOCKOPT);
  }
  socket_un.sun_family = AF_UNIX;
  const size_t length = offsetof(sockaddr_un, sun_path) + std::strlen(socket_un.sun_path);
  if (connect(sock, reinterpret_cast<const sockaddr*>(&socket_un), static_cast<socklen_t>(length)) < 0) {
    return stop_opening(Hb_Csock_CONNECT_FAILURE, HB_ECONNECT);
  }
  return Hb_Success;
}

int32_t Hb_Csock::Error() { return myError; }

int Hb_Csock::socket() const { return sock; }

Hb_Rc Hb_Csock::send(char* buf, int len) {
  std::array<iovec, vector_capacity> vectors = {{{&len, sizeof len}, {buf, static_cast<size_t>(len)}}};
  const int written = hb_writev_retry(sock, vectors.data(), vector_capacity);
  if (written >= 0) {
    if (written - HB_FRAME_PREFIX_SIZE == len) {
      return Hb_Success;
    }
    myError = Hb_Csock_SEND_INCOMPLETE;
    return Hb_Failure;
  }
  switch (errno) {
    case EFAULT:
      myError = Hb_Csock_INVALID_BUF_POINTER;
      break;
    case EPIPE:
      myError = Hb_Csock_END_OF_FILE;
      socket_eof = Hb_True;
      break;
    case EIO:
      myError = Hb_Csock_SEND_IO_ERROR;
      break;
    default:
      myError = Hb_Csock_SEND_FAILURE;
  }
  return Hb_Failure;
}

int hb_writev_retry(int fd, iovec* vector, int vectorLen) {
  if (vectorLen < 0 || vectorLen > vector_capacity) {
    errno = EINVAL;
    return -1;
  }
  std::array<iovec, vector_capacity> local{};
  std::copy_n(vector, vectorLen, local.begin());
  int total = 0;
  for (;;) {
    const ssize_t n = writev(fd, local.data(), vectorLen);
    if (n == 0) {
      return total;
    }
    if (n < 0 && errno == EINTR) {
      continue;
    }
    if (n < 0 && errno != EAGAIN) {
      return static_cast<int>(n);
    }
    if (n > 0) {
      total += static_cast<int>(n);
      const int end = vector_of_end(local.data(), vectorLen, n);
      if (end == vectorLen - 1) {
        return total;
      }
      if (end != 0) {
        // A write that ended inside a vector cannot be continued: the count gets negative, and the next attempt fails.
        vectorLen -= end + 1;
      }
    }
    pollfd writable = {fd, POLLOUT, 0};
    poll(&writable, 1, -1);
  }
}

Hb_Rc Hb_Csock::read_failed() {
  switch (errno) {
    case EIO:
      myError = Hb_Csock_RECV_IO_ERROR;
      break;
    case EFAULT:
      myError = Hb_Csock_INVALID_BUF_POINTER;
      break;
    default:
      myError = Hb_Csock_RECV_FAILURE;
  }
  return Hb_Failure;
}

Hb_Rc Hb_Csock::recvn(char* buf, int len) {
  int remaining = len;
  while (remaining > 0) {
    const ssize_t n = read(sock, buf, static_cast<size_t>(remaining));
    if (n > 0) {
      buf += n;
      remaining -= static_cast<int>(n);
    } else if (n == 0) {
      socket_eof = Hb_True;
      myError = Hb_Csock_END_OF_FILE;
      return Hb_Failure;
    } else if (errno == EAGAIN) {
      if (!may_read_again(sock)) {
        return Hb_Failure;
      }
    } else if (errno != EINTR) {
      return read_failed();
    }
  }
  myError = Hb_Csock_NO_ERROR;
  return Hb_Success;
}

Hb_Rc Hb_Csock::receive(char** recvptr, int& len) {
  hb_frame_length length = 0;
  if (recvn(reinterpret_cast<char*>(&length), sizeof length) != Hb_Success) {
    return Hb_Failure;
  }
  std::unique_ptr<char[]> message(length >= 0 ? new (std::nothrow) char[static_cast<size_t>(length)] : nullptr);
  if (message == nullptr) {
    myError = Hb_Csock_RECV_FAILURE;
    return Hb_Failure;
  }
  *recvptr = message.get();  // kept by the caller after a failure too, when it must not be used
  if (recvn(message.get(), length) != Hb_Success) {
    return Hb_Failure;
  }
  message.release();
  len = length;
  return Hb_Success;
}
