// Owner of the new-group pipe, through which a subscription asks for the initial group.
#pragma once

#include "VEX_EVMONHandler.h"

class EVMONNewGroupEventHandler : public EVMONHandler {
 public:
  EVMONNewGroupEventHandler(int32_t* fds, char* path);  // fds: read end, write end; both are taken over
  explicit EVMONNewGroupEventHandler(char* path);       // a monitor file in the place of a pipe
  ~EVMONNewGroupEventHandler() override;

  // Answers one request with the present group.
  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
  int32_t getWriteFd() { return evmon_pipe_write_fd; }

 private:
  int32_t evmon_pipe_write_fd;
};
