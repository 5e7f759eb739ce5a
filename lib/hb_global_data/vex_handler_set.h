// The set of VEX-mode handlers.
#pragma once

// Deletes every handler and nulls its pointer.
void VEX_delete_global_event_handlers();
