// The monitor of its own for splits and merges. What it delivers is delivered by the monitor of nodes, too, which tells
// it: here nothing but "nothing to read" succeeds, and a record is given back unread.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

class EVMONSplitMergeEventHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONSplitMergeEventHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
