// Base of the VEX-mode descriptor handlers.
#pragma once

#include <cstdint>

#include "hb_client/events.h"

class EVMONHandler {
 public:
  EVMONHandler(int32_t* fds, char* path);
  virtual ~EVMONHandler();
  EVMONHandler(const EVMONHandler&) = delete;
  EVMONHandler& operator=(const EVMONHandler&) = delete;

  virtual Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p);

  int getFileDescriptor() { return evmon_fd; }

  // All registered descriptors and a -1, in a new array of the caller's.
  static int* getFileDescriptors();
  static int getNumbersOfFileDescriptors();

  // Serves the first descriptor of the list that has a handler.
  static void dispatch(int* descriptor_list, Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p,
                       Hb_Rc* rc);

 protected:
  int32_t evmon_fd;
  char* evmon_fname;
};
