#include <cerrno>

#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_HBC_trace.h"
#include "hb_client/vex.h"
#include "hb_communication/connection.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/start_up.h"
#include "vex_platform_records.h"

Hb_Rc hb_vex_msg_received_from(Hb_Node_Number node) {
  if (hb_init() != Hb_Success) {
    return Hb_Failure;
  }
  trace_values(Trace_Info, trace_message_received_from, node);
  if (event_pipe_handler_p == nullptr) {
    trace(Trace_Info, trace_no_event_pipe);
    return fail(HB_ENOPIPEHANDLER);
  }
  Hb_VEX_Event* event = nullptr;
  event_pipe_handler_p->constructNodeEvent(node, &event, HB_EVENT_JOIN);
  if (event == nullptr) {
    return Hb_Success;
  }
  event->type = VEX_Daemon_Up;
  event->node_num = static_cast<uint16_t>(node);
  VEX_add_event_at_end(event);
  return VEX_write_to_event_pipe();
}

Hb_Rc hb_vex_delayed_daemon_shutdown() {
  if (hb_init() != Hb_Success) {
    return Hb_Failure;
  }
  trace(Trace_Info, trace_delayed_shutdown);
  return hb_send(HB_DELAYED_DAEMON_SHUTDOWN, nullptr, 0);
}

void hb_refresh_boot_ip_addrs_and_update_events() {
  trace(Trace_Info, trace_refresh_and_update_begins);
  zu_vex_net_intf_info_t* list = nullptr;
  hb_refresh_boot_ip_addrs(&list);
  const Interface_List interfaces(list);
  if (adapter_event_handler_p != nullptr) {
    // Without a notification nothing is put into a group.
    Hb_Events events = HB_EVENT_NONE;
    Hb_Name name = {};
    Hb_Seq_Num sequence = 0;
    adapter_event_handler_p->update_global_table_and_construct_events(&events, name, nullptr, &sequence, nullptr,
                                                                      interfaces.get());
  }
  trace(Trace_Info, trace_refresh_and_update_ends);
}
