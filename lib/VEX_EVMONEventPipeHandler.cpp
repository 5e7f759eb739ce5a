#include "VEX_EVMONEventPipeHandler.h"

#include <unistd.h>

EVMONEventPipeHandler::EVMONEventPipeHandler(int32_t* fds, char* path)
    : EVMONHandler(fds, path), evmon_pipe_write_fd(fds[1]) {
  evmon_fd = fds[0];
}

EVMONEventPipeHandler::~EVMONEventPipeHandler() {
  if (evmon_pipe_write_fd != -1) {
    close(evmon_pipe_write_fd);
  }
}

Hb_Rc EVMONEventPipeHandler::handler(Hb_Events* /*events*/, char* /*name*/, Hb_Group* /*group*/,
                                     Hb_Seq_Num* /*seqnum_p*/) {
  return Hb_Failure;  // no monitor can be opened here, so nothing is ever delivered through this pipe
}
