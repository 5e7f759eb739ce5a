// The monitor of the cluster's list of nodes.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

class EVMONNodeListHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONNodeListHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
