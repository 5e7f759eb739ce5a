// The connection to the daemon: where it is, making and dropping it, sending requests and awaiting answers.
#pragma once

#include "hb_communication/packet.h"
#include "hb_global_data/state.h"
#include "hb_protocol/framing.h"
#include "hb_protocol/replies.h"
#include "hb_protocol/requests.h"
#include "platform/Hb_Csock.h"
#include "platform/Hb_Select.h"

extern Hb_Csock* client_socket;                      // null when closed
extern Hb_Select* client_select;                     // null when closed
extern int client_pid;                               // written into every request
extern char HB_SERVER_SOCKET[HB_SOCKET_PATH_SIZE];   // base path
extern char SERVER_SOCK_FNAME[HB_SOCKET_PATH_SIZE];  // path in use, and key path of the shared memory
extern timeval reply_from_server_deftimeout;

Hb_Rc hb_init_communication();
Hb_Rc hb_remove_socket();
Hb_Rc hb_remove_client_select();

// One request. Without data msg_len is a number, and that many zero bytes are sent. Nothing is sent in VEX mode.
// Fails with HB_EINVAL (length), HB_ECOMM (no connection), HB_ENOMEM or one of the send errors.
Hb_Rc hb_send(Hb_Client_Request msg_type, void* msg_data, int msg_len);

// One packet of the given kind; the caller releases it with array delete. It holds at least a whole header, where
// zeros stand for bytes that were not sent. A packet of another kind is lost. A null timeout waits without limit.
// Fails with HB_ENOTREADY, HB_ECOMM, HB_EDAEMONGONE, HB_EBADREPLY or HB_ENOMEM.
Hb_Rc hb_get_reply_from_server(Hb_Client_Reply msg_type, client_packet_t*& return_packet, timeval* timeout);

// As above, with the packet's length kept.
Hb_Rc await_reply(Hb_Client_Reply kind, Packet& packet, const timeval* timeout);

// Waits until the connection is readable. Fails with HB_ENOTREADY or HB_ECOMM.
Hb_Rc await_readable(const timeval& timeout);

// The next packet, whatever it is. Fails with HB_EDAEMONGONE, HB_ECOMM or HB_ENOMEM.
Hb_Rc receive_packet(Packet& packet);

// The configuration at start-up: asked of the daemon, or built from the cluster services in VEX mode.
Hb_Rc hb_recv_config_info(zu_vex_net_intf_info_t* p_intf_tbl);

// A hook of the allocator; does nothing.
void mowl_pin_new_data(void* ptr, size_t sz);
