#include "VEX_EVMONConfigurationHandler.h"

#include "VEX_HBC_trace.h"
#include "VEX_migration.h"
#include "hb_communication/vex_set_aside_table.h"
#include "hb_communication/vex_table_build.h"
#include "owned_event.h"
#include "table_comparison.h"
#include "vex_outputs.h"

namespace {

// What the new table changes; of each kind one event or none.
struct Changes {
  Owned_Event adapter_death;
  Owned_Event node_death;
  Owned_Event config;
  Owned_Event adapter_join;
  Owned_Event node_join;
  // Behind an older table that waits: who is up again since.
  Owned_Event node_return;
  Owned_Event adapter_return;

  bool has_deaths() const { return adapter_death != nullptr || node_death != nullptr; }
  bool has_joins() const { return adapter_join != nullptr || node_join != nullptr; }
};

Hb_Rc find_changes(EVMONHandler& handler, Changes& changes) {
  Hb_VEX_Event* adapter_death = nullptr;
  Hb_VEX_Event* node_death = nullptr;
  Hb_VEX_Event* config = nullptr;
  Hb_VEX_Event* adapter_join = nullptr;
  Hb_VEX_Event* node_join = nullptr;
  const Hb_Rc rc = tell_table_changes(handler, global_config_tbl_new,
                                      {&adapter_death, &node_death, &config, &adapter_join, &node_join});
  changes.adapter_death.reset(adapter_death);
  changes.node_death.reset(node_death);
  changes.config.reset(config);
  changes.adapter_join.reset(adapter_join);
  changes.node_join.reset(node_join);
  return rc;
}

// What the queue says of an older table that waits is told by now. Who is down or gone in it, and up again, is up in
// the table in force as well, so that only the older one shows the return.
Hb_Rc find_returns(EVMONHandler& handler, const Hb_Configuration_Internal& older, Changes& changes) {
  Hb_VEX_Event* nodes = nullptr;
  Hb_VEX_Event* adapters = nullptr;
  Hb_Rc rc = tell_lost_nodes(handler, global_config_tbl_new, older, HB_EVENT_JOIN, &nodes);
  if (rc == Hb_Success) {
    rc = tell_lost_adapters(handler, global_config_tbl_new, older, HB_EVENT_JOIN, &adapters);
  }
  changes.node_return.reset(nodes);
  changes.adapter_return.reset(adapters);
  return rc;
}

// Whether a configuration event has to bring the new table into force, where the comparison made none.
bool needs_configuration_event(const Changes& changes, bool waits) {
  return migrate_to_vex_prep ? changes.config == nullptr && (changes.has_deaths() || changes.has_joins())
                             : changes.has_deaths() || waits;
}

// All or nothing: a difference that is not told would be forgotten with the next table.
Hb_Rc prepare(EVMONHandler& handler, const Hb_Configuration_Internal* older, Changes& changes) {
  bool whole = find_changes(handler, changes) == Hb_Success;
  if (older != nullptr) {
    whole = whole && find_returns(handler, *older, changes) == Hb_Success;
  }
  if (whole && needs_configuration_event(changes, older != nullptr)) {
    changes.config.reset(VEX_new_configuration_event());
    whole = changes.config != nullptr;
  }
  return whole ? Hb_Success : fail(HB_ENOMEM);
}

// The death is delivered at once to who has read a notification, and to all others by the queue.
void deliver_adapter_death(EVMONHandler& handler, Owned_Event& death, const Vex_Outputs& out, bool at_once) {
  trace(Trace_Info, trace_update_adapter_deaths);
  *out.events = death->group.Hb_events;
  if (!put_subscription_name(out.events, out.name, networkEventSubscriptionName)) {
    trace(Trace_Info, trace_update_without_name);
  }
  *out.seqnum = 0;
  if (at_once) {
    handler.copy_adapter_Hb_Group(&death->group, out.group);
  } else {
    append_event(std::move(death));
  }
}

void deliver_configuration(const Vex_Outputs& out) {
  *out.events = HB_EVENT_CONFIGURATION;
  put_name(out.name, configuration_event_name);
}

void deliver_first(EVMONHandler& handler, Changes& changes, const Vex_Outputs& out, bool at_once) {
  if (changes.adapter_death != nullptr) {
    deliver_adapter_death(handler, changes.adapter_death, out, at_once);
  } else if (changes.config != nullptr) {
    deliver_no_event(out, 0);
  } else {
    deliver_configuration(out);
  }
}

void append_node_death(Owned_Event death) {
  if (death != nullptr) {
    trace(Trace_Info, trace_update_node_deaths);
    append_event(std::move(death));
  }
}

Hb_Rc take_effect() {
  trace(Trace_Info, trace_update_takes_effect);
  if (put_waiting_table_in_force() != Hb_Success) {
    return Hb_Failure;
  }
  hb_vex_dump_global_table(&global_config_tbl, "Update global table: current table after copy");
  return Hb_Success;
}

// With deaths the old table stays until the configuration event behind them is taken, and so it does behind an older
// table whose deaths are still in the queue: they name the old table's numbers.
bool takes_effect_at_once(const Changes& changes) { return !migrate_to_vex_prep && changes.config == nullptr; }

// Deaths come first.
void tell(EVMONHandler& handler, Changes& changes, const Vex_Outputs& out, bool at_once) {
  if (migrate_to_vex_prep) {
    append_event(std::move(changes.adapter_death));
    if (at_once) {
      deliver_no_event(out, 0);
    }
  } else {
    deliver_first(handler, changes, out, at_once);
  }
  append_node_death(std::move(changes.node_death));
  append_event(std::move(changes.config));
  append_event(std::move(changes.node_join));
  append_event(std::move(changes.adapter_join));
  append_event(std::move(changes.node_return));
  append_event(std::move(changes.adapter_return));
}

Hb_Rc update(EVMONHandler& handler, const Vex_Outputs& out, zu_evm_event_metadata_t* metadata,
             zu_vex_net_intf_info_t* interfaces) {
  hb_vex_dump_global_table(&global_config_tbl, "Update global table: old table");
  Set_Aside_Table older;
  Hb_Rc rc = hb_vex_update_global_tbl(&global_config_tbl_new, metadata, &global_config_tbl, interfaces);
  if (rc != Hb_Success) {
    return rc;
  }
  hb_vex_dump_global_table(&global_config_tbl_new, "Update global table: new table");
  {
    Changes changes;
    rc = prepare(handler, older.waiting(), changes);
    if (rc == Hb_Success && takes_effect_at_once(changes)) {
      rc = take_effect();
    }
    if (rc != Hb_Success) {
      return rc;
    }
    older.keep_new_table();
    tell(handler, changes, out, metadata != nullptr);
  }
  return VEX_write_to_event_pipe();
}

}  // namespace

Hb_Rc EVMONConfigurationHandler::handler(Hb_Events* /*events*/, char* /*name*/, Hb_Group* /*group*/,
                                         Hb_Seq_Num* /*seqnum_p*/) {
  return Hb_Success;
}

Hb_Rc EVMONConfigurationHandler::update_global_table_and_construct_events(Hb_Events* events, char* name,
                                                                          Hb_Group* group, Hb_Seq_Num* seqnum_p,
                                                                          zu_evm_event_metadata_t* metadata,
                                                                          zu_vex_net_intf_info_t* interfaces) {
  trace_values(Trace_Info, trace_update_begins, evmon_fd);
  const Hb_Rc rc = update(*this, {events, name, group, seqnum_p}, metadata, interfaces);
  trace_values(Trace_Info, trace_update_ends, evmon_fd, rc);
  return rc;
}
