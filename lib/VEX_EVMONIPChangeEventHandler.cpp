#include "VEX_EVMONIPChangeEventHandler.h"

#include <netinet/in.h>

#include <cerrno>

#include "VEX_interface_changes.h"
#include "hb_global_data/address_text.h"

namespace {

typedef zu_evm_event_ip_change_t Notification;

constexpr const char* p_ipchangeEVMONinitstr = "BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n";

void trace_notification(Notification& notification) {
  char address[INET6_ADDRSTRLEN];
  VEX_ntop(&notification.ip_addr, address);
  trace_data(Trace_Info, trace_ip_change,
             {block_of(notification.event_type), block_of(notification.node_number),
              block_of_interface(notification.p_interface_name), block_of_text(address)});
}

enum class Kind { change, alias, repeated };

Kind kind_of(bool is_repeated, bool is_in_a_table, bool is_boot_address) {
  if (!is_in_a_table && !is_boot_address) {
    return Kind::alias;
  }
  return is_repeated ? Kind::repeated : Kind::change;
}

bool is_in(const Hb_Configuration_Internal& table, const Notification& notification) {
  zu_vex_net_intf_info_t interface = {};
  interface.node_number = notification.node_number;
  interface.p_name = notification.p_interface_name;
  interface.ip_addr = notification.ip_addr;
  return find_adapter_of_interface(table, interface) != nullptr;
}

Kind kind_of(Notification& notification) {
  const bool is_now = is_in(global_config_tbl, notification);
  const bool will_be = is_in(table_about_to_take_effect(), notification);
  const bool is_boot =
      is_boot_interface(notification.node_number, notification.p_interface_name, &notification.ip_addr);
  switch (notification.event_type) {
    case ZU_EVM_ADDRESS_ADD:
      return kind_of(is_now && will_be, is_now || will_be, is_boot);
    case ZU_EVM_ADDRESS_DELETE:
      return kind_of(!is_now && !will_be, is_now || will_be, is_boot);
    default:
      return Kind::change;
  }
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

Hb_Rc cannot_be_read(int read_result, int descriptor) {
  trace_values(Trace_Errors, trace_ip_change_read_failed, read_result, descriptor, errno);
  return Hb_Failure;
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
    return cannot_be_read(read_result, evmon_fd);
  }
  const Monitor_Record<Notification> notification(record);
  return tell(*this, *notification, out);
}
