// A table that was rebuilt for one node knows of changes of others, too, whose own notifications are still to be read.
// Taken over now, they would be no changes any more when those are read, and the caller would never learn of them.
#pragma once

#include "hb_global_data/state.h"

// In the new table every other node, and each of its adapters, is what it is in the table in force; what the table in
// force does not have is down.
void hold_back_changes_of_others(Hb_Configuration_Internal& new_table, uint32_t node);
