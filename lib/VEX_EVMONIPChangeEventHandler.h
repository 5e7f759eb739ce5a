// The monitor of interface addresses.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

class EVMONIPChangeEventHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONIPChangeEventHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
