// The set of VEX-mode handlers.
#pragma once

#include "hb_client/types.h"

// All or none of them.
Hb_Rc VEX_create_global_event_handlers();

// Opens the monitors and the pipes. A platform without monitors has no handler, and that is a success.
Hb_Rc VEX_create_global_event_handlers_internal();

// Deletes every handler and nulls its pointer.
void VEX_delete_global_event_handlers();

// The same, but for the monitor of the peer group-services daemon.
void VEX_delete_global_event_handlers_except_brix_monitor();
