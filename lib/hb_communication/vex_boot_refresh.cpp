#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_HBC_trace.h"
#include "hb_client/vex.h"
#include "hb_communication/vex_table_build.h"
#include "vex_platform_records.h"

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
