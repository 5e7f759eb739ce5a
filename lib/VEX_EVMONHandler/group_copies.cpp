#include <algorithm>

#include "VEX_EVMONHandler.h"
#include "VEX_HBC_trace.h"

namespace {

bool both_given(const Hb_Group* source, const Hb_Group* destination, Trace_Record missing) {
  const bool given = source != nullptr && destination != nullptr;
  if (!given) {
    trace(Trace_Info, missing);
  }
  return given;
}

void copy_heading(const Hb_Group& source, Hb_Group& destination) {
  destination.Hb_group_status = source.Hb_group_status;
  destination.Hb_group_type = source.Hb_group_type;
  destination.Hb_events = source.Hb_events;
}

// A site without the number of its node.
void copy_site(const Hb_Site_Info& source, Hb_Site_Info& destination) {
  const uint32_t node_number = destination.node_number;
  destination = source;
  destination.node_number = node_number;
}

// The caller's node number of the local site stays, by the interface's definition.
template <typename Site_Event>
void copy_sites(const Site_Event& source, Site_Event& destination) {
  copy_site(source.local_site, destination.local_site);
  destination.remote_site = source.remote_site;
}

}  // namespace

void EVMONHandler::copy_adapter_Hb_Group(Hb_Group* source, Hb_Group* destination) {
  if (!both_given(source, destination, trace_adapter_group_not_copied)) {
    return;
  }
  const Hb_Adapter_Membership_Grp& from = source->Hb_membership_grp_union.Hb_adapter_membership_grp;
  Hb_Adapter_Membership_Grp& to = destination->Hb_membership_grp_union.Hb_adapter_membership_grp;
  copy_heading(*source, *destination);
  to.Hb_group_incarnation = from.Hb_group_incarnation;
  to.Hb_group_leader = from.Hb_group_leader;
  const Hb_Adapter_Number entries =
      std::min<Hb_Adapter_Number>(adapter_number_limit(global_config_tbl), HB_MAX_ADAPTERS);
  std::copy_n(from.Hb_adapter_list, entries, to.Hb_adapter_list);
  to.Hb_num_adapters = from.Hb_num_adapters;
}

void EVMONHandler::copy_node_Hb_Group(Hb_Group* source, Hb_Group* destination) {
  if (both_given(source, destination, trace_node_group_not_copied)) {
    copy_heading(*source, *destination);
    destination->Hb_membership_grp_union.Hb_node_membership_grp =
        source->Hb_membership_grp_union.Hb_node_membership_grp;
  }
}

void EVMONHandler::copy_site_split_Hb_Group(Hb_Group* source, Hb_Group* destination) {
  if (both_given(source, destination, trace_site_group_not_copied)) {
    copy_heading(*source, *destination);
    copy_sites(source->Hb_membership_grp_union.site_split_info, destination->Hb_membership_grp_union.site_split_info);
  }
}

void EVMONHandler::copy_site_merge_Hb_Group(Hb_Group* source, Hb_Group* destination) {
  if (!both_given(source, destination, trace_site_group_not_copied)) {
    return;
  }
  const Hb_Site_Merge_Info& from = source->Hb_membership_grp_union.site_merge_info;
  Hb_Site_Merge_Info& to = destination->Hb_membership_grp_union.site_merge_info;
  copy_heading(*source, *destination);
  to.num_local_up_nodes = from.num_local_up_nodes;
  to.num_remote_up_nodes = from.num_remote_up_nodes;
  copy_sites(from, to);
}
