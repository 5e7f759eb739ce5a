// Owner of the event pipe, which wakes a caller when synthesized events wait. A byte in it says no more than that; how
// many there are says nothing about how many events wait.
#pragma once

#include "VEX_EVMONHandler.h"

class EVMONEventPipeHandler : public EVMONHandler {
 public:
  EVMONEventPipeHandler(int32_t* fds, char* path);  // fds: read end, write end; both are taken over
  explicit EVMONEventPipeHandler(char* path);       // a monitor file in the place of a pipe
  ~EVMONEventPipeHandler() override;

  // Takes one event from the queue, whether or not a byte waits, and delivers it; then wakes the caller for the next.
  // A new configuration takes effect here, in the caller's thread. Without memory for it the call fails with
  // HB_EVEXTBL_COPY and delivers nothing; its event is the next one again.
  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
  int32_t getWriteFd();

 protected:
  int32_t evmon_pipe_write_fd;
};
