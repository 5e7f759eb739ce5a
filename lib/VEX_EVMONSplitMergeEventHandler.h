// The monitor of its own for splits and merges.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

class EVMONSplitMergeEventHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONSplitMergeEventHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
