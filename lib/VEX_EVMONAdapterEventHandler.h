// The monitor of interfaces. The whole configuration is rebuilt through this handler, too.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

class EVMONAdapterEventHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONAdapterEventHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
