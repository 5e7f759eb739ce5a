// Splits and merges of the cluster, as the monitor of nodes delivers them.
#include <cerrno>
#include <cstdlib>
#include <memory>

#include "VEX_EVMONNodeLivenessHandler.h"
#include "adapters_by_node.h"
#include "vex_outputs.h"
#include "vex_platform_records.h"
#include "vex_waiting_table.h"

namespace {

typedef zu_evm_event_split_merge_cfg_t Report;

void trace_report(const Report& report, int descriptor) {
  trace_data(Trace_Info, trace_split_merge,
             {block_of(report.event_type), block_of(report.event_subtype), block_of(report.node_number),
              block_of(report.num_local_node_up), block_of(report.num_remote_node_up), block_of(report.sequence_number),
              block_of(report.reason_number), block_of(descriptor)});
}

void trace_no_memory(int line) {
  const int error = errno;
  const char file[100] = "lib/VEX_EVMONNodeLivenessHandler";
  trace_data(Trace_Errors, trace_split_merge_no_memory, {block_of(error), block_of(file), block_of(line)});
}

bool is_split_or_merge(const Report& report) {
  return report.event_type == ZU_EVM_SUBCLUSTER_SPLIT || report.event_type == ZU_EVM_SUBCLUSTER_MERGE;
}

// The array is the C allocator's, as hb_free_split_info() gives it back there. An empty one is a block, too.
uint32_t* copy_of(const uint32_t* nodes, uint32_t count) {
  if (count > HB_MAX_NODES || (count != 0 && nodes == nullptr)) {
    errno = ENOMEM;
    return nullptr;
  }
  auto* copy = static_cast<uint32_t*>(std::calloc(count != 0 ? count : 1, sizeof *nodes));
  if (copy != nullptr && count != 0) {
    std::memcpy(copy, nodes, count * sizeof *nodes);
  }
  return copy;
}

bool fill_subcluster(Hb_Subcluster_Info& subcluster, const uint32_t* nodes, uint32_t count) {
  uint32_t* copy = copy_of(nodes, count);
  subcluster.num_up_nodes = copy != nullptr ? count : 0;
  subcluster.node_numbers = copy;
  return copy != nullptr;
}

void empty_subclusters(Hb_Split_Merge_Info& info) {
  hb_free_split_info(&info);
  info.local_subcluster.num_up_nodes = 0;
  info.remote_subcluster.num_up_nodes = 0;
}

// Both lists or none of them. What comes behind the one that there is no memory for stays as it was.
bool fill_subclusters(Hb_Split_Merge_Info& info, const Report& report) {
  if (!fill_subcluster(info.local_subcluster, report.local_node_numbers, report.num_local_node_up)) {
    trace_no_memory(__LINE__);
    return false;
  }
  if (!fill_subcluster(info.remote_subcluster, report.remote_node_numbers, report.num_remote_node_up)) {
    trace_no_memory(__LINE__);
    empty_subclusters(info);
    return false;
  }
  info.subtype = static_cast<uint32_t>(report.event_subtype);
  return true;
}

// Adds the node to the event, which is made first, and marks it down; false without memory for the event.
bool mark_down(EVMONHandler& handler, Hb_Node_config_state& node, Hb_VEX_Event*& death) {
  handler.constructNodeEvent(node.node_num, &death, HB_EVENT_DEATH);
  if (death == nullptr) {
    return false;
  }
  node.state = Hb_Entity_Down;
  node.reason = Hb_Entity_State_Reason_LOCAL_SPLIT_Down;
  mark_node_down_in_waiting_table(static_cast<uint32_t>(node.node_num), node.reason);
  return true;
}

// The nodes of the other part that were up are down from now on, and in one event.
bool mark_nodes_down(EVMONHandler& handler, const Report& report, Hb_VEX_Event*& death) {
  for (uint32_t index = 0; index < report.num_remote_node_up; ++index) {
    const uint32_t number = report.remote_node_numbers[index];
    auto* node = static_cast<Hb_Node_config_state*>(Hash_search(number, global_config_tbl.node_hash));
    if (node == nullptr) {
      trace_values(Trace_Info, trace_split_node_unknown, number);
    } else if (node->state != Hb_Entity_Up) {
      trace_values(Trace_Info, trace_split_node_not_up, number, node->state);
    } else if (!mark_down(handler, *node, death)) {
      return false;
    }
  }
  return true;
}

// An event for each node that had an adapter up; fails when memory did not do for one of them.
Hb_Rc queue_adapter_deaths(EVMONHandler& handler, const Report& report) {
  const Adapters_By_Node by_node;
  Hb_Rc rc = Hb_Success;
  for (uint32_t index = 0; index < report.num_remote_node_up; ++index) {
    Hb_VEX_Event* adapters = nullptr;
    const auto node = static_cast<zu_int32_t>(report.remote_node_numbers[index]);
    if (construct_adapter_death_on_node(handler, node, &adapters, by_node) != Hb_Success) {
      rc = Hb_Failure;
    }
    if (adapters != nullptr) {
      VEX_add_event_at_end(adapters);
      mark_adapters_down_in_waiting_table(report.remote_node_numbers[index]);
    }
  }
  return rc;
}

Hb_Rc queue_deaths(EVMONHandler& handler, const Report& report, Hb_VEX_Event& death) {
  death.group.Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes =
      static_cast<int32_t>(report.num_remote_node_up);
  VEX_add_event_at_end(&death);
  const Hb_Rc rc = queue_adapter_deaths(handler, report);
  const Hb_Rc written = VEX_write_to_event_pipe();
  return rc == Hb_Success ? written : rc;
}

Hb_Events events_of(zu_evm_event_type_t type) {
  switch (type) {
    case ZU_EVM_SUBCLUSTER_SPLIT:
      return HB_EVENT_SUBCLUSTER_SPLIT;
    case ZU_EVM_SUBCLUSTER_MERGE:
      return HB_EVENT_SUBCLUSTER_MERGE;
    default:
      return HB_EVENT_NONE;
  }
}

void name_event(const Vex_Outputs& out) {
  if (splitMergeEventSubscriptionName[0] != '\0') {
    put_name(out.name, splitMergeEventSubscriptionName);
    return;
  }
  *out.events = HB_EVENT_NONE;
  put_name(out.name, empty_event_name);
  trace(Trace_Info, trace_split_merge_unsubscribed);
}

void head_group(const Vex_Outputs& out) {
  out.group->Hb_events = *out.events;
  out.group->Hb_group_type = Hb_Subcluster_Group;
  out.group->Hb_group_status = Hb_Group_Stable;
}

// Without memory nothing is marked, queued or left in the group.
Hb_Rc tell(EVMONHandler& handler, const Report& report, const Vex_Outputs& out) {
  *out.events = events_of(report.event_type);
  Hb_Split_Merge_Info& info = out.group->Hb_membership_grp_union.split_info;
  if (is_split_or_merge(report) && !fill_subclusters(info, report)) {
    return fail(HB_ENOMEM);
  }
  Hb_Rc rc = Hb_Success;
  if (report.event_type == ZU_EVM_SUBCLUSTER_SPLIT) {
    trace(Trace_Info, trace_split_marks_nodes);
    Hb_VEX_Event* death = nullptr;
    if (!mark_nodes_down(handler, report, death)) {
      empty_subclusters(info);
      return fail(HB_ENOMEM);
    }
    rc = death != nullptr ? queue_deaths(handler, report, *death) : Hb_Success;
  }
  name_event(out);
  head_group(out);
  return rc;
}

}  // namespace

Hb_Rc EVMONNodeLivenessHandler::SplitMergeEventHandler(zu_evm_event_split_merge_cfg_t* record, Hb_Events* events,
                                                       char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) {
  trace_values(Trace_Info, trace_split_merge_begins, evmon_fd);
  Hb_Rc rc = Hb_Failure;
  if (record != nullptr) {
    trace_report(*record, evmon_fd);
    *seqnum_p = static_cast<Hb_Seq_Num>(record->sequence_number);
    if (record->event_subtype != ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_REMOTE) {
      rc = tell(*this, *record, {events, name, group, seqnum_p});
    }
  }
  trace_values(Trace_Info, trace_split_merge_ends, evmon_fd);
  return rc;
}
