#include "VEX_migration.h"

#include "VEX_HBC_trace.h"
#include "hb_client/migration.h"
#include "hb_communication/connection.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/node_marks.h"
#include "hb_global_data/vex_handler_set.h"
#include "hb_global_data/vex_migration_events.h"

bool migrate_to_vex_prep = false;

namespace {

// The marks of nodes are those of the table in force, whatever the trial makes of them.
Hb_Rc build_trial_table(Hb_Configuration_Internal& trial) {
  const Node_Marks marks;
  const Hb_Rc rc = hb_vex_update_global_tbl(&trial, nullptr, nullptr, nullptr);
  marks.put_back();
  return rc;
}

// Fails when the platform does not have this node under its number, or not all nodes of the daemon.
Hb_Rc check_trial_table(Hb_Configuration_Internal& trial) {
  if (global_config_tbl.local_node_number != trial.local_node_number) {
    trace_values(Trace_Errors, trace_migration_local_node_differs, global_config_tbl.local_node_number,
                 trial.local_node_number);
    return Hb_Failure;
  }
  const Hb_Rc rc = VEX_find_tbl1_node_in_tbl2(&global_config_tbl, &trial);
  if (rc != Hb_Success) {
    set_hb_errno(HB_EMIGRATE_TBL);
    trace_values(Trace_Errors, trace_migration_node_missing, rc);
  }
  return rc;
}

Hb_Rc stop_preparing() {
  VEX_delete_global_event_handlers();
  return Hb_Failure;
}

}  // namespace

Hb_Rc VEX_find_tbl1_node_in_tbl2(Hb_Configuration_Internal* _tbl1, Hb_Configuration_Internal* _tbl2) {
  const int count = nodes_in_list(*_tbl1);
  for (int index = 0; index < count; ++index) {
    const int32_t node = _tbl1->node_list[index].node_num;
    if (Hash_search(static_cast<uint32_t>(node), _tbl2->node_hash) == nullptr) {
      set_hb_errno(HB_ENODEMISSING);
      trace_values(Trace_Errors, trace_node_missing_from_table, node);
      return Hb_Failure;
    }
  }
  return Hb_Success;
}

Hb_Rc hb_migrate_to_vex_prep(void) {
  migrate_to_vex_prep = true;
  const Hb_Rc created = VEX_create_global_event_handlers();
  if (created != Hb_Success) {
    set_hb_errno(HB_EMIGRATE_PREP);
    trace_values(Trace_Errors, trace_migration_handlers_failed, created, HB_EMIGRATE_PREP);
    return stop_preparing();
  }
  // A yardstick alone. What it holds is not released: with the handlers it stays for the rest of the process.
  Hb_Configuration_Internal trial = {};
  const Hb_Rc built = build_trial_table(trial);
  if (built != Hb_Success) {
    trace_values(Trace_Errors, trace_migration_table_failed, built);
    return Hb_Failure;
  }
  return check_trial_table(trial) == Hb_Success ? Hb_Success : stop_preparing();
}

Hb_Rc hb_migrate_to_vex_commit(void) {
  hb_vex_delayed_daemon_shutdown();
  IsVEX = Hb_True;
  hb_remove_client_select();
  hb_remove_socket();
  hb_migrate_construct_global_table_and_events();
  migrate_to_vex_prep = false;
  return Hb_Success;
}

Hb_Rc hb_migrate_to_vex_abort(void) {
  VEX_delete_global_event_handlers();
  return Hb_Success;
}
