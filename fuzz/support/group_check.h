// Every accessor of an event's record, compared with what the record holds.
#pragma once

#include "hb_client/group.h"
#include "support/hostile.h"

namespace fuzz {

// What bounds the lists of a record.
struct Group_Limits {
  uint32_t adapters;
  int nodes;
};

// Changes the cursor alone. Whole walks are left out when only their ends are wanted.
void check_group(Hb_Group& group, const Group_Limits& limits, const Hostile& hostile, bool whole_walks);

}  // namespace fuzz
