// The monitor of the repository disk.
#pragma once

#include "VEX_EVMONHandler.h"

class EVMONRepositoryDiskHandler : public EVMONHandler {
 public:
  explicit EVMONRepositoryDiskHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
};
