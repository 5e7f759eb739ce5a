// The node-presence table, derived from the configuration table, and looking adapters up.
#pragma once

#include "hb_global_data/state.h"

// Rebuilds global_node_tbl and global_num_nodes from adap_hash.
void hb_init_global_node_tbl();

// Releases what the configuration table owns. Sites stay, and so do the stale flags of global_node_tbl.
void hb_deinit_global_config_and_node_tbl();

// The adapter's record, or the address of HB_INVALID_ADAP; never null.
Hb_Adapter* hb_get_adap_entry(Hb_Adapter_Number adap_num);
