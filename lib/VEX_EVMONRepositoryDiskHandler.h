// The monitor of the repository disk.
//
// A notification is traced, and is no event: the disk is none of the things that the configuration knows.
#pragma once

#include "VEX_EVMONHandler.h"

class EVMONRepositoryDiskHandler : public EVMONHandler {
 public:
  explicit EVMONRepositoryDiskHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
