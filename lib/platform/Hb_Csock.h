// The connection to the daemon's local stream socket.
#pragma once

#include <sys/un.h>

#include "Hb_Csock_Base.h"

struct iovec;

// Socket error codes, kept until the next failure or the next whole recvn.
enum {
  Hb_Csock_NO_ERROR = 0,
  Hb_Csock_INVALID_BUF_POINTER = 1,
  Hb_Csock_OPEN_FAILURE = 2,
  Hb_Csock_OPT_FAILURE = 3,
  Hb_Csock_CONNECT_FAILURE = 4,
  Hb_Csock_SEND_INCOMPLETE = 5,
  Hb_Csock_SEND_WOULD_BLOCK = 6,    // never set
  Hb_Csock_SEND_NOT_RESTARTED = 7,  // never set
  Hb_Csock_SEND_IO_ERROR = 8,
  Hb_Csock_SEND_FAILURE = 9,
  Hb_Csock_RECV_WOULD_BLOCK = 10,    // never set
  Hb_Csock_RECV_NOT_RESTARTED = 11,  // never set
  Hb_Csock_RECV_IO_ERROR = 12,
  Hb_Csock_RECV_FAILURE = 13,
  Hb_Csock_END_OF_FILE = 14,
};

class Hb_Csock : public Hb_Csock_Base {
 public:
  // Connects to SERVER_SOCK_FNAME. A failure shows in Error() and in the library's error number.
  Hb_Csock();
  ~Hb_Csock() override;

  int32_t Error() override;
  Hb_Rc send(char* buf, int len) override;
  // A new array of the length that was sent, which may be 0; the caller releases it with array delete.
  Hb_Rc receive(char** recvptr, int& len) override;
  int socket() const override;

  Hb_Boolean eof() const { return socket_eof; }
  Hb_Rc recvn(char* buf, int len);

 private:
  Hb_Rc open_and_connect();
  Hb_Rc stop_opening(int32_t socket_error, int library_error);
  Hb_Rc read_failed();

  int sock;
  Hb_Boolean socket_eof;
  sockaddr_un socket_un;
  int32_t myError;  // the base keeps one of its own, which nobody sets
};

// Writes both vectors, waiting when the socket is full. Bytes written, or -1. Exact only for a write that ends with a
// vector, which is what a local socket does.
int hb_writev_retry(int fd, iovec* vector, int vectorLen);
