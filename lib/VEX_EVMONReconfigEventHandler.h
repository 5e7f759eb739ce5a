// The monitor of cluster reconfiguration.
//
// A notification is traced, and is no event; the table stays as it is, as for the list of nodes.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

class EVMONReconfigEventHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONReconfigEventHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
