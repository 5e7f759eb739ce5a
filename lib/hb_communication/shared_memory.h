// Attaching the segments that the daemon publishes. The client never writes to them.
#pragma once

#include "hb_global_data/state.h"

// Finds and attaches the three segments and finds the semaphores. A failure leaves what was attached before it, for
// the next hb_detach_shared_memory().
Hb_Rc hb_init_shared_memory();

void hb_detach_shared_memory();
