// Turning the daemon's packets into events.
#pragma once

#include "hb_client/control.h"
#include "hb_client/events.h"
#include "hb_communication/packet.h"

extern Hb_client_hb_info_t client_hb_info;  // as last reported by the daemon

// Fill the outputs from one packet and release it; always Hb_Success. The packet is whole: its lists lie within it.
Hb_Rc hb_get_adapter_event(Hb_Events* events, char* name, Hb_Group* group, client_packet_t* pack);
Hb_Rc hb_get_node_event(Hb_Events* events, char* name, Hb_Group* group, client_packet_t* pack);

// Sets all entries of the group's node list to false.
void reset_node_membership_group_node_list(Hb_Group* group);
