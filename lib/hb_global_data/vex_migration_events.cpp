#include "hb_global_data/vex_migration_events.h"

#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_HBC_trace.h"
#include "hb_communication/vex_table_build.h"

void hb_migrate_construct_global_table_and_events() {
  if (adapter_event_handler_p == nullptr) {
    trace(Trace_Info, trace_no_adapter_handler);
    set_hb_errno(HB_EMIGRATE_EVENTS);
    return;
  }
  trace(Trace_Info, trace_vex_start);
  // Without a notification nothing is delivered at once: these are for nobody, and a group is not filled.
  Hb_Events events = HB_EVENT_NONE;
  Hb_Name name = {};
  Hb_Seq_Num sequence = 0;
  zu_vex_net_intf_info_t* interfaces = nullptr;
  hb_refresh_boot_ip_addrs(&interfaces);
  // The interfaces are dropped, not released.
  adapter_event_handler_p->update_global_table_and_construct_events(&events, name, nullptr, &sequence, nullptr,
                                                                    interfaces);
}
