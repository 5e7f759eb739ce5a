// Building the configuration table from the daemon's configuration message.
#pragma once

#include "hb_communication/packet.h"
#include "hb_global_data/state.h"

// Builds the table from a packet. Whatever the table held is forgotten, not released. A configuration that is not
// usable is ignored.
void hb_get_adapter_network(client_packet_t* recv_pack);

// The same for a packet whose length is known. Fails with HB_EBADREPLY (not usable) or HB_ENOMEM; the table that was
// there then stays in force.
Hb_Rc load_first_configuration(const Packet& packet);

// Replaces the table in force and rebuilds the node table. Fails as load_first_configuration() does.
Hb_Rc load_configuration_update(const Packet& packet);

// Whether its counts are such that the table can hold it and its records lie within the packet.
bool is_usable_configuration(const Packet& packet);
