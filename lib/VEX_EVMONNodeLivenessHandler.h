// The monitor of nodes, which also delivers splits and merges.
//
// What the interface leaves open, for the report of a node that went down or came up:
// - The table that is rebuilt for it takes effect when the configuration event behind it is taken. It knows of every
//   other node, too. When two reports wait at once, the first one's table has both changes, and the second report finds
//   no change any more and is taken as a repeated one. So the first report tells both: what its table changes for the
//   members of other nodes is queued with it, as the comparison of two tables tells it, deaths before the configuration
//   event and joins, of nodes first, behind it.
// - So is the death of an adapter of the node itself that its return finds up in the table in force alone.
// - When only a new table is to be told, it takes effect at once. With deaths of others it cannot, as they are named by
//   the numbers of the table in force: it waits behind them, and the empty event is delivered. It waits, too, when
//   there is no memory for it to take effect: the report fails with HB_EVEXTBL_COPY, and its event is queued.
// - An adapter of the node that is told dead does not come back with the table that was rebuilt for it, whatever the
//   cluster services say.
// - A report that is stale, repeated or that cannot be told leaves no table behind; one that waited before it goes on
//   waiting.
// - Without memory for one of the events nothing of the report is told, and it fails with HB_ENOMEM. The table in force
//   stays as it was, so that the next one that is built has the same changes.
// - A return for which the cluster services do not tell the adapters again is told with those that the rebuilt table
//   has up.
// - A record that is no record (a null one) is as a read that failed.
//
// For a split or a merge:
// - A missing list, or one of more nodes than a cluster has, is as one that there is no memory for. Of other types of
//   record the lists are not looked at; they have no event bits.
// - When the caller cannot be woken for the deaths the call fails, with both lists in the group all the same.
// - Without memory it fails with HB_ENOMEM, and nobody is marked down.
#pragma once

#include "VEX_EVMONHandler.h"
#include "zu_evm.h"

struct Vex_Outputs;

class EVMONNodeLivenessHandler : public EVMONHandler {
 public:
  explicit EVMONNodeLivenessHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

  // Marks the nodes of the other part down, queues their deaths, and delivers both parts to the caller, who owns the
  // two lists of node numbers then.
  Hb_Rc SplitMergeEventHandler(zu_evm_event_split_merge_cfg_t* record, Hb_Events* events, char* name, Hb_Group* group,
                               Hb_Seq_Num* seqnum_p);

 private:
  Hb_Rc read_and_tell(const Vex_Outputs& out);
};
