// The monitor of the cluster's list of nodes.
//
// A notification is traced, record by record, and is no event. The table stays as it is: the monitors of nodes and of
// interfaces tell what a node does that is new in the list or left it, and rebuild the table for that; taken in here
// already, the change would be none to them, and the caller would never learn of it.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

class EVMONNodeListHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONNodeListHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

 private:
  Hb_Rc read_and_trace(Hb_Events* events);
};
