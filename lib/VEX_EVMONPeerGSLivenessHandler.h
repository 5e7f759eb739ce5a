// The monitor of the peer group-services daemon.
//
// A notification is traced, and is no event: that a node comes back with its daemon is told when a message of the
// daemon was received.
#pragma once

#include "VEX_EVMONHandler.h"

class EVMONPeerGSLivenessHandler : public EVMONHandler {
 public:
  explicit EVMONPeerGSLivenessHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
