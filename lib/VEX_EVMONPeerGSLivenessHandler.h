// The monitor of the peer group-services daemon.
#pragma once

#include "VEX_EVMONHandler.h"

class EVMONPeerGSLivenessHandler : public EVMONHandler {
 public:
  explicit EVMONPeerGSLivenessHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
