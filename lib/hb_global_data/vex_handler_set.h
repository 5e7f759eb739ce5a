// The set of VEX-mode handlers.
//
// What the interface leaves open:
// - Every monitor is needed. Where the first one that is opened says that there are none here (-1), the platform has no
//   monitors, and nothing is made; but where a monitor is open, there are some, and the others are missed. Whatever
//   keeps a handler from being made, the whole set goes.
// - A handler that is there already stays the one of its kind, so that creating the set again adds what is missing.
// - A cluster that does not tell its name has none; memory that the name does not fit in is a failure.
// - Nobody waits for room in a pipe: writing into a full one fails. Of the new-group pipe the read end waits, as its
//   handler does not ask whether a request is there. Both are closed in programs that the caller starts.
#pragma once

#include "hb_client/types.h"

// All or none of them.
Hb_Rc VEX_create_global_event_handlers();

// Opens the monitors and the pipes. A platform without monitors has no handler, and that is a success. What was made
// before something failed stays.
Hb_Rc VEX_create_global_event_handlers_internal();

// Deletes every handler and nulls its pointer.
void VEX_delete_global_event_handlers();

// The same, but for the monitor of the peer group-services daemon.
void VEX_delete_global_event_handlers_except_brix_monitor();
