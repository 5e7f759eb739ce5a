#include "VEX_EVMONIPChangeEventHandler.h"

#include <netinet/in.h>

#include <cerrno>

#include "VEX_interface_changes.h"
#include "hb_global_data/address_text.h"

namespace {

typedef zu_evm_event_ip_change_t Notification;

void trace_notification(Notification& notification) {
  char address[INET6_ADDRSTRLEN];
  VEX_ntop(&notification.ip_addr, address);
  trace_data(Trace_Info, trace_ip_change,
             {block_of(notification.event_type), block_of(notification.node_number),
              block_of_interface(notification.p_interface_name), block_of_text(address)});
}

// What a table says of the address.
enum class Place { nowhere, down, up };

Place place_in(const Hb_Configuration_Internal& table, const Notification& notification) {
  zu_vex_net_intf_info_t interface = {};
  interface.node_number = notification.node_number;
  interface.p_name = notification.p_interface_name;
  interface.ip_addr = notification.ip_addr;
  const Hb_Adapter* adapter = find_adapter_of_interface(table, interface);
  if (adapter == nullptr) {
    return Place::nowhere;
  }
  return adapter->Hb_state == Hb_Entity_Up ? Place::up : Place::down;
}

enum class Kind { change, alias, repeated };

Kind kind_of(Notification& notification) {
  const Place now = place_in(global_config_tbl, notification);
  const Place soon = place_in(table_about_to_take_effect(), notification);
  const bool is_in_no_table = now == Place::nowhere && soon == Place::nowhere;
  const bool came = notification.event_type == ZU_EVM_ADDRESS_ADD;
  if (!came && notification.event_type != ZU_EVM_ADDRESS_DELETE) {
    return Kind::change;
  }
  if (is_in_no_table &&
      !is_boot_interface(notification.node_number, notification.p_interface_name, &notification.ip_addr)) {
    return Kind::alias;
  }
  const bool is_repeated = came ? now == Place::up && soon == Place::up : is_in_no_table;
  return is_repeated ? Kind::repeated : Kind::change;
}

Hb_Rc tell_change(EVMONConfigurationHandler& handler, Notification& notification, const Vex_Outputs& out) {
  zu_evm_event_metadata_t metadata = {};
  metadata.category = ZU_EVM_EVENT_CATEGORY_IP_CHANGE;
  metadata.event.p_ip_change = &notification;
  return rebuild_and_tell(handler, metadata, out);
}

Hb_Rc tell(EVMONConfigurationHandler& handler, Notification& notification, const Vex_Outputs& out) {
  trace_notification(notification);
  switch (kind_of(notification)) {
    case Kind::repeated:
      return deliver_no_event(out, 0);
    case Kind::alias:
      return deliver_alias(out);
    default:
      return tell_change(handler, notification, out);
  }
}

}  // namespace

EVMONIPChangeEventHandler::EVMONIPChangeEventHandler(char* path)
    : EVMONConfigurationHandler(path, p_ipchangeEVMONinitstr) {}

Hb_Rc EVMONIPChangeEventHandler::handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) {
  trace_values(Trace_Info, trace_ip_change_begins, evmon_fd);
  const Hb_Rc rc = read_and_tell({events, name, group, seqnum_p});
  trace_values(Trace_Info, trace_ip_change_ends, evmon_fd);
  return rc;
}

Hb_Rc EVMONIPChangeEventHandler::read_and_tell(const Vex_Outputs& out) {
  Notification* record = nullptr;
  const int read_result = zu_evm_read_ip_change(evmon_fd, &record);
  if (read_result == ZU_EVM_NOTHING) {
    trace(Trace_Info, trace_ip_change_nothing);
    *out.events = HB_EVENT_NONE;
    return Hb_Success;
  }
  if (read_result != ZU_EVM_RECORD || record == nullptr) {
    return cannot_be_read(trace_ip_change_read_failed, read_result, evmon_fd, errno);
  }
  const Monitor_Record<Notification> notification(record);
  return tell(*this, *notification, out);
}
