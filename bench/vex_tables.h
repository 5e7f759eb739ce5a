// The tables of VEX mode at the size of the largest cluster, over cluster services that have all of it ready. They live
// in a library of their own: what is measured here is inside the client, behind its interface.
#pragma once

#include <cstddef>

#include "hb_client/configuration.h"
#include "zu_vex.h"

#pragma GCC visibility push(default)

namespace bench {

// The interfaces of every node, all up, as the services hand them out.
const zu_vex_net_intf_info_t* all_interfaces();

// Builds the new table; one that was there has to be released before.
void build_new_table();
void release_new_table();

// Puts the whole cluster into the table in force and the new one.
void fill_both_tables();
void release_both_tables();
const Hb_Adapter* adapters_in_force();

// Compares the two. Returns how many events there are of it.
int compare_tables();

// A caller's event pipe.
class Event_Delivery {
 public:
  Event_Delivery();
  ~Event_Delivery();
  Event_Delivery(const Event_Delivery&) = delete;
  Event_Delivery& operator=(const Event_Delivery&) = delete;

  // One event of an adapter: made, queued, the caller woken, taken and copied out.
  void deliver_one();
};

}  // namespace bench

#pragma GCC visibility pop
