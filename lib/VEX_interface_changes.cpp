#include "VEX_interface_changes.h"

#include "hb_communication/vex_table_build.h"

bool is_boot_interface(uint32_t node, const char* name, zu_vex_IP_address6_t* address) {
  return node < HB_MAX_NODES &&
         hb_check_if_in_global_boot_ip_list(static_cast<int>(node), name != nullptr ? name : "", address) == Hb_True;
}

bool is_adapter_on(const Hb_Adapter& adapter, const char* name) {
  return std::strncmp(adapter.Hb_adapter_type, name != nullptr ? name : "", interface_name_length) == 0;
}

Hb_Rc rebuild_and_tell(EVMONConfigurationHandler& handler, zu_evm_event_metadata_t metadata, const Vex_Outputs& out) {
  zu_vex_net_intf_info_t* list = nullptr;
  const Hb_Rc rc = hb_get_new_net_intf_info(&list);
  const Interface_List interfaces(list);
  if (rc != Hb_Success) {
    return fail(HB_EVEXTBL_INTF);
  }
  return handler.update_global_table_and_construct_events(out.events, out.name, out.group, out.seqnum, &metadata,
                                                          interfaces.get());
}
