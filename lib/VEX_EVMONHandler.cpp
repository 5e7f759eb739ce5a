#include "VEX_EVMONHandler.h"

#include <unistd.h>

#include <new>

#include "VEX_HBC_trace.h"
#include "hb_global_data/state.h"

EVMONHandler::EVMONHandler(int32_t* /*fds*/, char* path) : evmon_fd(-1), evmon_fname(path) {}

EVMONHandler::~EVMONHandler() {
  if (evmon_fd != -1) {
    close(evmon_fd);
  }
}

Hb_Rc EVMONHandler::handler(Hb_Events* /*events*/, char* /*name*/, Hb_Group* /*group*/, Hb_Seq_Num* /*seqnum_p*/) {
  return Hb_Failure;
}

int* EVMONHandler::getFileDescriptors() { return new (std::nothrow) int[1]{-1}; }

int EVMONHandler::getNumbersOfFileDescriptors() { return 0; }

void EVMONHandler::dispatch(int* descriptor_list, Hb_Events* /*events*/, char* /*name*/, Hb_Group* /*group*/,
                            Hb_Seq_Num* /*seqnum_p*/, Hb_Rc* rc) {
  trace(Trace_Info, trace_dispatch_begins);
  if (descriptor_list != nullptr) {
    // No monitor can be opened here, so no descriptor has a handler.
    set_hb_errno(HB_EDISPATCH);
    trace_values(Trace_Errors, trace_dispatch_without_handler, descriptor_list[0]);
    *rc = Hb_Failure;
  }
  trace(Trace_Info, trace_dispatch_ends);
}
