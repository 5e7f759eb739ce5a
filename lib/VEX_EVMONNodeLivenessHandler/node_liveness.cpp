#include "VEX_EVMONNodeLivenessHandler.h"

#include <cerrno>
#include <memory>
#include <utility>

#include "VEX_EVMONNodeLivenessHandler/changes_of_others.h"
#include "hb_communication/vex_set_aside_table.h"
#include "hb_communication/vex_table_build.h"
#include "vex_outputs.h"
#include "vex_platform_records.h"
#include "vex_waiting_table.h"

namespace {

typedef zu_evm_event_node_liveness_t Report;

Hb_Node_config_state* node_of(const Hb_Configuration_Internal& table, uint32_t node) {
  return static_cast<Hb_Node_config_state*>(Hash_search(node, table.node_hash));
}

bool is_in_state(const Hb_Node_config_state* node, Hb_Entity_State state) {
  return node != nullptr && node->state == state;
}

void trace_report(Trace_Record record, const Report& report) {
  trace_data(Trace_Info, record,
             {block_of(report.event_type), block_of(report.node_number), block_of(report.node_id),
              block_of(report.sequence_number), block_of(report.reason_number)});
}

// Everything of a death or a return that takes memory.
struct Report_Events {
  Owned_Event configuration;
  Owned_Event node;      // of a death
  Owned_Event adapters;  // of the node, when there are any
  Changes_Of_Others others;
};

// One report of a node that went down or came up, and what the tables say of the node before and after it.
class Node_Change {
 public:
  Node_Change(EVMONHandler& handler, Report& report, const Vex_Outputs& out)
      : handler_(handler), report_(report), out_(out), node_(static_cast<zu_int32_t>(report.node_number)) {}

  Hb_Rc tell();

 private:
  Hb_Rc rebuild(zu_vex_net_intf_info_t* interfaces);
  Hb_Rc went_down();
  Hb_Rc came_up();
  Hb_Rc deliver_nothing(Hb_Seq_Num seqnum);
  Hb_Rc deliver_stale(Trace_Record record);
  Hb_Rc deliver_repeated();
  Hb_Rc make_death(Report_Events& events, bool is_node_death_known);
  Hb_Rc make_node_death(Report_Events& events);
  Hb_Rc make_return(Report_Events& events);
  Hb_Rc tell_death(Report_Events& events, bool is_node_death_known);
  Hb_Rc tell_return(Report_Events& events);
  Hb_Rc deliver_death(Report_Events& events, bool is_node_death_known);
  void deliver_adapters(Hb_Group& adapters);
  void deliver_node_death();
  Hb_Rc deliver_new_table(Owned_Event& event);

  Hb_Seq_Num number_of_report() const { return static_cast<Hb_Seq_Num>(report_.sequence_number); }

  EVMONHandler& handler_;
  Report& report_;
  Vex_Outputs out_;
  zu_int32_t node_;
  Hb_Node_config_state* old_ = nullptr;
  const Hb_Node_config_state* new_ = nullptr;
  bool is_told_ = false;  // the table that was built for it is to take effect
};

Hb_Rc Node_Change::tell() {
  trace_report(trace_node_liveness, report_);
  if (node_ == global_config_tbl.local_node_number) {
    return deliver_nothing(number_of_report());
  }
  old_ = node_of(global_config_tbl, report_.node_number);
  zu_vex_net_intf_info_t* list = nullptr;
  const bool is_refreshed = hb_get_new_net_intf_info(&list) == Hb_Success;
  const Interface_List interfaces(list);
  if (!is_refreshed) {
    return deliver_nothing(0);
  }
  Set_Aside_Table older;
  const Hb_Rc rc = rebuild(interfaces.get());
  if (rc != Hb_Success) {
    return rc;
  }
  new_ = node_of(global_config_tbl_new, report_.node_number);
  const Hb_Rc told = report_.event_type == ZU_EVM_EVENT_DOWN ? went_down() : came_up();
  if (is_told_) {
    older.keep_new_table();
  }
  return told;
}

Hb_Rc Node_Change::rebuild(zu_vex_net_intf_info_t* interfaces) {
  zu_evm_event_metadata_t metadata = {};
  metadata.category = ZU_EVM_EVENT_CATEGORY_NODE_LIVENESS;
  metadata.event.p_node_liveness = &report_;
  return hb_vex_update_global_tbl(&global_config_tbl_new, &metadata, &global_config_tbl, interfaces);
}

Hb_Rc Node_Change::deliver_nothing(Hb_Seq_Num seqnum) {
  handler_.fillInNodeEventInfo(node_, HB_EVENT_NONE, out_.name, out_.group);
  return deliver_no_event(out_, seqnum);
}

Hb_Rc Node_Change::deliver_stale(Trace_Record record) {
  trace_report(record, report_);
  return deliver_no_event(out_, 0);
}

Hb_Rc Node_Change::deliver_repeated() {
  const Hb_Rc rc = deliver_nothing(number_of_report());
  trace_values(Trace_Info, trace_node_repeated, report_.event_type, report_.node_number, old_->state, old_->reason);
  return rc;
}

Hb_Rc Node_Change::went_down() {
  if (is_in_state(new_, Hb_Entity_Up)) {
    return deliver_stale(trace_node_death_is_stale);
  }
  const bool was_down = is_in_state(old_, Hb_Entity_Down);
  if (was_down && old_->reason != Hb_Entity_State_Reason_BRIXD_Down) {
    return deliver_repeated();
  }
  Report_Events events;
  return make_death(events, was_down) == Hb_Success ? tell_death(events, was_down) : fail(HB_ENOMEM);
}

// The adapters come last, as they go down in the table in force with it.
Hb_Rc Node_Change::make_death(Report_Events& events, bool is_node_death_known) {
  events.configuration.reset(VEX_new_configuration_event());
  if (events.configuration == nullptr || events.others.find(handler_, node_, node_) != Hb_Success ||
      (!is_node_death_known && make_node_death(events) != Hb_Success)) {
    return Hb_Failure;
  }
  Hb_VEX_Event* adapters = nullptr;
  const Hb_Rc rc = handler_.constructAdapterEventOnNode(node_, &adapters, HB_EVENT_DEATH);
  events.adapters.reset(adapters);
  return rc;
}

Hb_Rc Node_Change::make_node_death(Report_Events& events) {
  Hb_VEX_Event* death = nullptr;
  handler_.constructNodeEvent(node_, &death, HB_EVENT_DEATH);
  events.node.reset(death);
  if (death == nullptr) {
    trace(Trace_Info, trace_no_node_death_event);
    return Hb_Failure;
  }
  return Hb_Success;
}

Hb_Rc Node_Change::tell_death(Report_Events& events, bool is_node_death_known) {
  is_told_ = true;
  mark_adapters_down_in_waiting_table(report_.node_number);
  *out_.events = HB_EVENT_DEATH;
  const Hb_Rc rc = deliver_death(events, is_node_death_known);
  events.others.append_deaths();
  append_event(std::move(events.configuration));
  events.others.append_joins();
  events.adapters = nullptr;
  const Hb_Rc written = VEX_write_to_event_pipe();
  return rc == Hb_Success ? written : rc;
}

// The death of a node whose group-services daemon was down is known already; its adapters are not.
Hb_Rc Node_Change::deliver_death(Report_Events& events, bool is_node_death_known) {
  if (is_node_death_known && events.adapters == nullptr && !events.others.has_deaths()) {
    return deliver_new_table(events.configuration);
  }
  if (events.adapters != nullptr) {
    deliver_adapters(events.adapters->group);
    append_event(std::move(events.node));
  } else if (!is_node_death_known) {
    deliver_node_death();
  } else {
    deliver_no_event(out_, 0);
  }
  return Hb_Success;
}

void Node_Change::deliver_adapters(Hb_Group& adapters) {
  trace(Trace_Info, trace_adapters_of_dead_node);
  if (networkEventSubscriptionName[0] != '\0') {
    put_name(out_.name, networkEventSubscriptionName);
  } else {
    *out_.events = HB_EVENT_NONE;
    put_name(out_.name, empty_event_name);
    trace(Trace_Info, trace_dead_node_adapters_unsubscribed);
  }
  *out_.seqnum = 0;
  handler_.copy_adapter_Hb_Group(&adapters, out_.group);
}

void Node_Change::deliver_node_death() {
  handler_.fillInNodeEventInfo(node_, HB_EVENT_DEATH, out_.name, out_.group);
  *out_.seqnum = number_of_report();
  if (old_ != nullptr) {
    old_->state = Hb_Entity_Down;
    if (new_ != nullptr) {
      old_->reason = new_->reason;
    }
  }
}

// A table that there is no memory for waits for the event.
Hb_Rc Node_Change::deliver_new_table(Owned_Event& event) {
  if (put_waiting_table_in_force() != Hb_Success) {
    deliver_no_event(out_, 0);
    return Hb_Failure;
  }
  event = nullptr;
  old_ = nullptr;
  new_ = nullptr;
  *out_.events = HB_EVENT_CONFIGURATION;
  *out_.seqnum = 0;
  put_name(out_.name, configuration_event_name);
  return Hb_Success;
}

Hb_Rc Node_Change::came_up() {
  if (is_in_state(new_, Hb_Entity_Down)) {
    return deliver_stale(trace_node_return_is_stale);
  }
  if (is_in_state(old_, Hb_Entity_Up)) {
    return deliver_repeated();
  }
  Report_Events events;
  return make_return(events) == Hb_Success ? tell_return(events) : fail(HB_ENOMEM);
}

// An adapter of the node that is up in the table in force alone is as one of another node: the return does not name it.
Hb_Rc Node_Change::make_return(Report_Events& events) {
  events.configuration.reset(VEX_new_configuration_event());
  if (events.configuration == nullptr || events.others.find(handler_, VEX_no_node, node_) != Hb_Success) {
    return Hb_Failure;
  }
  Hb_VEX_Event* adapters = nullptr;
  const Hb_Rc rc = handler_.constructAdapterEventOnNode(node_, &adapters, HB_EVENT_JOIN);
  events.adapters.reset(adapters);
  if (rc == Hb_Success) {
    return Hb_Success;
  }
  return hb_get_errno() == HB_ENOMEM ? Hb_Failure : events.others.find_adapter_joins(handler_);
}

Hb_Rc Node_Change::tell_return(Report_Events& events) {
  is_told_ = true;
  *out_.events = HB_EVENT_JOIN;
  handler_.fillInNodeEventInfo(node_, HB_EVENT_JOIN, out_.name, out_.group);
  *out_.seqnum = number_of_report();
  events.others.append_deaths();
  append_event(std::move(events.configuration));
  append_event(std::move(events.adapters));
  events.others.append_joins();
  if (old_ != nullptr) {
    old_->state = Hb_Entity_Up;
  }
  return VEX_write_to_event_pipe();
}

}  // namespace

EVMONNodeLivenessHandler::EVMONNodeLivenessHandler(char* path) : EVMONHandler(path, nullptr) {}

Hb_Rc EVMONNodeLivenessHandler::handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) {
  trace_values(Trace_Info, trace_node_liveness_begins, evmon_fd);
  const Hb_Rc rc = read_and_tell({events, name, group, seqnum_p});
  trace_values(Trace_Info, trace_node_liveness_ends, evmon_fd, rc);
  return rc;
}

Hb_Rc EVMONNodeLivenessHandler::read_and_tell(const Vex_Outputs& out) {
  zu_evm_event_node_or_split_merge_cfg_t record = {};
  const int read_result = zu_evm_read_node_liveness(evmon_fd, &record);
  if (read_result == ZU_EVM_NOTHING) {
    trace(Trace_Info, trace_node_liveness_nothing);
    *out.events = HB_EVENT_NONE;
    return Hb_Success;
  }
  if (read_result == ZU_EVM_NODE_LIVENESS_RECORD && record.p_event_node_liveness != nullptr) {
    const Monitor_Record<Report> report(record.p_event_node_liveness);
    return Node_Change(*this, *report, out).tell();
  }
  if (read_result == ZU_EVM_SPLIT_MERGE_RECORD && record.p_event_split_merge_cfg != nullptr) {
    const Monitor_Record<zu_evm_event_split_merge_cfg_t> split_merge(record.p_event_split_merge_cfg);
    return SplitMergeEventHandler(split_merge.get(), out.events, out.name, out.group, out.seqnum);
  }
  return cannot_be_read(trace_node_liveness_read_failed, read_result, errno, evmon_fd);
}
