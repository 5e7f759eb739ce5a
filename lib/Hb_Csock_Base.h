// A connected stream socket that carries length-prefixed messages.
#pragma once

#include <cstdint>

#include "hb_client/types.h"

class Hb_Csock_Base {
 public:
  Hb_Csock_Base();
  virtual ~Hb_Csock_Base();
  Hb_Csock_Base(const Hb_Csock_Base&) = delete;
  Hb_Csock_Base& operator=(const Hb_Csock_Base&) = delete;

  virtual int32_t Error();
  virtual Hb_Rc send(char* buf, int len) = 0;
  virtual Hb_Rc receive(char** recvptr, int& len) = 0;
  virtual int socket() const = 0;

 protected:
  int32_t myError;
};
