// The list of an adapter group: for each number whether the adapter is named.
#pragma once

#include <algorithm>
#include <cstring>

#include "configuration_table.h"
#include "hb_client/group.h"

// Names nobody among the adapters with the first `entries` numbers. All of them are 384 KiB, which a memset gets done
// best in every build.
inline void clear_adapter_list(Hb_Adapter_Membership_Grp& membership, Hb_Adapter_Number entries) {
  static_assert(HB_NOT_IN_GROUP == 0xFFFFFFFFU, "all bits set");
  entries = std::min<Hb_Adapter_Number>(entries, HB_MAX_ADAPTERS);
  std::memset(membership.Hb_adapter_list, 0xFF, entries * sizeof membership.Hb_adapter_list[0]);
}
