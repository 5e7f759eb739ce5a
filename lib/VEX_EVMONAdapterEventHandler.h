// The monitor of interfaces. The whole configuration is rebuilt through this handler, too.
//
// What a notification does:
// - An interface that came or went and is no boot interface is told as an alias: the event code is all that is written.
// - A boot interface that came or went has the table rebuilt, and the differences are told. When the interfaces cannot
//   be listed the call fails with HB_EVEXTBL_INTF.
// - An interface that went down or came up takes the adapters of all its addresses along: those whose state changes
//   are told at once, in one event, and are counted in the group. Their state changes in the table in force, and in one
//   that waits to take effect, which would otherwise bring the old state back.
// - The notification may have waited while more happened that is told by now, such as the death of the node. So the
//   cluster services are asked, and an adapter that they have in the other state is left as it is. Where they do not
//   answer, do not list it, or do not know its state, the notification counts.
// - A notification that changes no state is a repeated one: the empty event.
// - An interface that came up and is in no table is as one that came: the table is rebuilt. One that went down and is
//   in no table was never told of: the empty event. So is every other kind of notification.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"

struct Vex_Outputs;

// What the monitor is armed with.
inline constexpr const char* p_adapterEVMONinitstr = "BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n";

class EVMONAdapterEventHandler : public EVMONConfigurationHandler {
 public:
  explicit EVMONAdapterEventHandler(char* path);

  // The list of the group, if there is one, is without members from the start, also when the monitor cannot be read
  // then.
  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;

 private:
  Hb_Rc read_and_tell(const Vex_Outputs& out);
};
