// Base of the handlers whose notifications may change the configuration.
#pragma once

#include "VEX_EVMONHandler.h"
#include "zu_evm.h"

class EVMONConfigurationHandler : public EVMONHandler {
 public:
  EVMONConfigurationHandler(char* path, const char* p_initstr) : EVMONHandler(path, p_initstr) {}

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

  // Builds the table anew, and tells the differences to the one in force: one by the outputs, the others by the queue.
  Hb_Rc update_global_table_and_construct_events(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p,
                                                 zu_evm_event_metadata_t* metadata, zu_vex_net_intf_info_t* interfaces);
};
