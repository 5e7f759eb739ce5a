// Base of the handlers whose notifications may change the configuration.
//
// What the interface leaves open:
// - While a client prepares to move, or after it gave that up, everything is queued; a notification that is read then
//   delivers the empty event. A death or a join is followed by a configuration event then, too, also where nothing of
//   the configuration differs, as the states are told and have to be in force.
// - When only nodes died, no death is delivered at once, and the caller gets the empty event.
// - When an older new table still waits for its configuration event, this one waits in its place, and who is up again
//   since is told as well: the death is in the queue, and the table in force does not know of it.
// - Without memory for one of the events, or for the new table to take effect at once, nothing is told. The table in
//   force stays, and so does an older new table that waits for its configuration event: the next notification finds the
//   same differences again.
#pragma once

#include "VEX_EVMONHandler.h"
#include "zu_evm.h"

class EVMONConfigurationHandler : public EVMONHandler {
 public:
  EVMONConfigurationHandler(char* path, const char* p_initstr) : EVMONHandler(path, p_initstr) {}

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

  // Builds the table anew, and tells the differences to the one in force: one by the outputs, the others by the queue.
  // The group is written with a notification only. Fails as the table build does, with HB_ENOMEM, with HB_EVEXTBL_COPY
  // (no memory to take effect), or when the caller cannot be woken.
  Hb_Rc update_global_table_and_construct_events(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p,
                                                 zu_evm_event_metadata_t* metadata, zu_vex_net_intf_info_t* interfaces);
};
