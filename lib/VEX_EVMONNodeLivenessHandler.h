// The monitor of nodes, which also delivers splits and merges.
#pragma once

#include "VEX_EVMONHandler.h"
#include "zu_evm.h"

class EVMONNodeLivenessHandler : public EVMONHandler {
 public:
  explicit EVMONNodeLivenessHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

  // Marks the nodes of the other part down, queues their deaths, and delivers both parts to the caller.
  Hb_Rc SplitMergeEventHandler(zu_evm_event_split_merge_cfg_t* record, Hb_Events* events, char* name, Hb_Group* group,
                               Hb_Seq_Num* seqnum_p);
};
