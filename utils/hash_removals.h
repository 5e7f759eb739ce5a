// For what is derived from a table: it has to be made anew when an entry that the table had is replaced or goes.
#pragma once

#include <cstdint>

// Raised with every such change of any table, its release included.
extern uint32_t hash_removals;
