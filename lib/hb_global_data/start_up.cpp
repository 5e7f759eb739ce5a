#include "hb_global_data/start_up.h"

#include <cstring>

#include "VEX_HBC_trace.h"
#include "VEX_migration.h"
#include "hb_communication/connection.h"
#include "hb_communication/shared_memory.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/mutex_section.h"
#include "hb_global_data/node_table.h"
#include "hb_global_data/vex_handler_set.h"

void hbapi_global_data_once_init() {
  pthread_mutexattr_t new_mutex_attrs;
  HB_GLOBAL_DATA_ASSERT_ZERO(pthread_mutexattr_init(&new_mutex_attrs));
  HB_GLOBAL_DATA_ASSERT_ZERO(pthread_mutexattr_settype(&new_mutex_attrs, PTHREAD_MUTEX_RECURSIVE));
  HB_GLOBAL_DATA_ASSERT_ZERO(pthread_mutex_init(&global_boot_ip_list_mutex, &new_mutex_attrs));
  HB_GLOBAL_DATA_ASSERT_ZERO(pthread_mutex_init(&event_queue_list_and_sequence_mutex, &new_mutex_attrs));
  HB_GLOBAL_DATA_ASSERT_ZERO(pthread_mutexattr_destroy(&new_mutex_attrs));
}

void hbapi_mutex_cleanup_handler(void* p_argument) { pthread_mutex_unlock(static_cast<pthread_mutex_t*>(p_argument)); }

namespace {

void clear_subscription_names() {
  std::memset(nodeEventSubscriptionName, 0, sizeof nodeEventSubscriptionName - 1);
  std::memset(networkEventSubscriptionName, 0, sizeof networkEventSubscriptionName - 1);
}

// Whatever these still held is forgotten, not released; the nodes stay as they are until the table is loaded.
void forget_adapter_tables() {
  global_config_tbl.Hb_global_adapter_list = nullptr;
  global_config_tbl.adap_hash = nullptr;
  global_config_tbl.ip_hash = nullptr;
  global_config_tbl.site_hash = nullptr;
}

// The interfaces without aliases, in p_interfaces, and the boot addresses that tell which are aliases.
Hb_Rc get_boot_interfaces(zu_vex_net_intf_info_t** p_interfaces) {
  const int query_result = zu_vex_get_boot_addrs(&global_boot_ip_list);
  if (query_result != 0) {
    trace_values(Trace_Errors, trace_boot_addresses_failed, query_result);
    return Hb_Failure;
  }
  Hb_Rc rc = hb_vex_get_net_intf_info_and_mark_alias(&global_vex_net_intf_tbl, global_boot_ip_list);
  if (rc == Hb_Failure) {
    trace_values(Trace_Errors, trace_mark_alias_failed, rc);
    return rc;
  }
  rc = hb_copy_net_intf_filter_by_flag(p_interfaces, global_vex_net_intf_tbl, ZU_VEX_INTF_ALIAS, Hb_True);
  if (rc == Hb_Failure) {
    trace_values(Trace_Errors, trace_filter_failed, rc);
  }
  return rc;
}

Hb_Rc start_vex(zu_vex_net_intf_info_t** p_interfaces) {
  trace(Trace_Info, trace_vex_start);
  Hb_Rc rc = Hb_Failure;
  HB_MUTEX_SECTION_BEGIN(global_boot_ip_list_mutex)
  const Hb_Global_Lists lists_of_last_start = hb_take_global_lists();
  rc = get_boot_interfaces(p_interfaces);
  if (rc == Hb_Failure) {
    // All lists are dropped, not freed, by the interface's definition.
    hb_take_global_lists();
  } else {
    hb_release_global_lists(lists_of_last_start);
  }
  HB_MUTEX_SECTION_END(global_boot_ip_list_mutex)
  if (rc == Hb_Failure) {
    trace(Trace_Errors, trace_start_failed);
  }
  return rc;
}

// The event behind it may still be in the queue, which outlives the stop. A client that never was in VEX mode nor
// prepared for it has none.
void drop_waiting_table() {
  if (IsVEX != Hb_False || migrate_to_vex_prep) {
    empty_global_config_table(&global_config_tbl_new);
  }
}

// Kept out of hb_init(), which every query goes through.
[[gnu::cold, gnu::noinline]] Hb_Rc start() {
  make_mutex_once();
  hbc_initialize_trace_once();
  clear_subscription_names();
  const bool daemon_mode = IsVEX == Hb_False;
  if (daemon_mode) {
    if (hb_init_communication() != Hb_Success) {
      return Hb_Failure;
    }
    // The connection stays open when this fails, and the next start opens another: nobody closes the first.
    if (hb_init_shared_memory() != Hb_Success) {
      return Hb_Failure;
    }
  }
  forget_adapter_tables();
  zu_vex_net_intf_info_t* interfaces = nullptr;
  if (!daemon_mode && start_vex(&interfaces) != Hb_Success) {
    return Hb_Failure;
  }
  if (hb_recv_config_info(interfaces) != Hb_Success) {
    trace(Trace_Errors, trace_start_failed);
    return Hb_Failure;
  }
  if (daemon_mode) {
    hb_init_global_node_tbl();
  }
  client_initialized = Hb_True;
  return Hb_Success;
}

}  // namespace

Hb_Rc hb_init(void) { return client_initialized == Hb_True ? Hb_Success : start(); }

Hb_Rc hb_terminate(void) {
  if (client_initialized == Hb_False) {
    return Hb_Success;
  }
  VEX_delete_global_event_handlers();
  hb_detach_shared_memory();
  hb_deinit_global_config_and_node_tbl();
  drop_waiting_table();
  client_initialized = Hb_False;
  IsVEX = Hb_False;
  hb_remove_client_select();
  return hb_remove_socket();
}

void hb_exit(void) { hb_terminate(); }
