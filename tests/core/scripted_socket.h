// A connection that fails as a test says, to be put in the place of the real one.
#pragma once

#include <optional>

#include "hb_communication/connection.h"
#include "platform/Hb_Csock.h"

namespace hb_test {

// Where nothing is scripted it is a connection like any other.
class ScriptedSocket : public Hb_Csock {
 public:
  int32_t Error() override { return error ? *error : Hb_Csock::Error(); }
  Hb_Rc send(char* buf, int len) override { return error ? Hb_Failure : Hb_Csock::send(buf, len); }
  int socket() const override { return descriptor ? *descriptor : Hb_Csock::socket(); }

  std::optional<int32_t> error;   // sending fails with that code
  std::optional<int> descriptor;  // what socket() says
};

// A connection that sends well and then fails to receive with that code.
class ScriptedReceiver : public Hb_Csock {
 public:
  int32_t Error() override { return error; }
  Hb_Rc receive(char** /*recvptr*/, int& /*len*/) override { return Hb_Failure; }

  int32_t error = 0;
};

// Puts a new connection of that type in the place of the client's, which is closed.
template <typename Socket>
Socket* replace_client_socket() {
  delete client_socket;
  auto* socket = new Socket;
  client_socket = socket;
  return socket;
}

}  // namespace hb_test
