// The monitor of nodes, which also delivers splits and merges.
#pragma once

#include "VEX_EVMONHandler.h"
#include "zu_evm.h"

struct Vex_Outputs;

class EVMONNodeLivenessHandler : public EVMONHandler {
 public:
  explicit EVMONNodeLivenessHandler(char* path);

  // A node that went down or came up is told by the outputs and the queue; the table that was rebuilt for it takes
  // effect when the configuration event behind them is taken. What that table knows of other nodes waits for their own
  // notifications. A record that is no record (a null one) is as a read
  // that failed. Without memory for the configuration event the report fails, and nothing of it is told.
  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

  // Marks the nodes of the other part down, queues their deaths, and delivers both parts to the caller, who owns the
  // two lists of node numbers then. A missing list, or one of more nodes than a cluster has, is refused as a record of
  // the other part is: nothing but the sequence number is written. When the caller cannot be woken for the deaths the
  // call fails, with both lists in the group all the same. An event that is neither a split nor a merge has no
  // event bits and no lists.
  Hb_Rc SplitMergeEventHandler(zu_evm_event_split_merge_cfg_t* record, Hb_Events* events, char* name, Hb_Group* group,
                               Hb_Seq_Num* seqnum_p);

 private:
  Hb_Rc read_and_tell(const Vex_Outputs& out);
};
