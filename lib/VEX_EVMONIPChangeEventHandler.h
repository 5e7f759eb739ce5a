// The monitor of interface addresses.
//
// What a notification does:
// - An address that came and is up in the tables already, or went and is in none, is a repeated one: the empty event.
//   (One that is in a table, and down, may have got there by the report of a node; its join is still to be told.)
// - One that came or went otherwise, and is neither a boot address nor in a table, is told as an alias: the event code
//   is all that is written.
// - Everything else is a change: the table is rebuilt, and the differences are told. When the interfaces cannot be
//   listed the call fails with HB_EVEXTBL_INTF.
// The tables are the one in force and one that waits to take effect.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

struct Vex_Outputs;

// What the monitor is armed with.
inline constexpr const char* p_ipchangeEVMONinitstr = "BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n";

class EVMONIPChangeEventHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONIPChangeEventHandler(char* path);

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

 private:
  Hb_Rc read_and_tell(const Vex_Outputs& out);
};
