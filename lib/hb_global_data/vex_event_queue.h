// The queue of synthesized events.
#pragma once

#include "hb_client/events.h"
#include "hb_global_data/state.h"

struct VEX_Event {
  int32_t sequence_num;
  Hb_Group group;
  VEX_Event* next;
  uint32_t type;
  uint16_t node_num;
  Hb_Site_Number site_num;
};

Hb_Boolean VEX_event_queue_is_empty();
