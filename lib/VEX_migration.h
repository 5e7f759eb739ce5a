// Moving a running client from the daemon to VEX mode.
//
// What the interface leaves open: the table that is built on trial marks no node as configured. The daemon's nodes stay
// marked until the move is made.
#pragma once

#include "hb_global_data/state.h"

extern bool migrate_to_vex_prep;  // from the start of a preparation to the end of a commit

// Fails with HB_ENODEMISSING unless every node of the first table is in the second.
Hb_Rc VEX_find_tbl1_node_in_tbl2(Hb_Configuration_Internal* _tbl1, Hb_Configuration_Internal* _tbl2);
