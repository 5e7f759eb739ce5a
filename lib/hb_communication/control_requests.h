// Requests that steer the daemon, as far as they are shared.
#pragma once

#include "hb_global_data/state.h"
#include "hb_protocol/requests.h"

// Sends a request about an adapter of this node: its network number, and the 32-bit value at data unless that is null.
// Fails with HB_EINVAL (not in the cluster, or another node's), HB_ENOADAPTER or as hb_send() does.
Hb_Rc hb_config_local_adapter(Hb_Adapter_Number adapter_num, Hb_Client_Request msg_type, void* data);

// Reports an adapter or a node of the cluster; the number travels in the request's length field.
Hb_Rc hb_notify_adapter_down(Hb_Adapter_Number adapter_num, Hb_Client_Request msg_type);
Hb_Rc hb_notify_node_down(Hb_Node_Number node_num, Hb_Client_Request msg_type);
