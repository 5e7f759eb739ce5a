// The table and the events that a client starts VEX mode with when it moves there.
#pragma once

// Builds the configuration of VEX mode and queues what it changes. Without a handler of interfaces the error number is
// HB_EMIGRATE_EVENTS, and there is neither.
void hb_migrate_construct_global_table_and_events();
