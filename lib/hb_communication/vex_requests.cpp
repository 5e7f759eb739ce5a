#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_HBC_trace.h"
#include "hb_client/vex.h"
#include "hb_communication/connection.h"
#include "hb_global_data/start_up.h"

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
