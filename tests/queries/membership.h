// Group records made by hand, and a client of the sparse cluster that reads them.
#pragma once

#include <gtest/gtest.h>

#include <cstring>
#include <memory>

#include "test_cluster.h"

namespace hb_test {

// Limit of adapter numbers in the sparse cluster: 4 adapters a node, 8 nodes.
inline constexpr Hb_Adapter_Number adapter_limit = 32;

// Types of records that are no adapter group, and of those that are no node group.
inline constexpr int types_but_adapter_group[] = {0, 2, 3, 4, 5, 6, -1};
inline constexpr int types_but_node_group[] = {1, 2, 3, 4, 5, 6, -1};

class Membership : public Loaded_Client {
 protected:
  ~Membership() override { trace_nothing(); }

  // An adapter group whose list is empty up to the limit of the cluster.
  void make_adapter_group(Hb_Events events) {
    std::memset(group.get(), 0, sizeof *group);
    group->Hb_group_type = Hb_Adapter_Group;
    group->Hb_events = events;
    for (Hb_Adapter_Number adapter = 0; adapter < adapter_limit; ++adapter) member(adapter) = 0xFFFFFFFFU;
  }

  void make_node_group(Hb_Events events) {
    std::memset(group.get(), 0, sizeof *group);
    group->Hb_group_type = Hb_Node_Group;
    group->Hb_events = events;
  }

  void set_type(int type) { group->Hb_group_type = static_cast<Hb_Group_Type>(type); }

  Hb_Incarnation& member(Hb_Adapter_Number adapter) {
    return group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list[adapter];
  }

  void set_node(size_t node, int32_t value) {
    group->Hb_membership_grp_union.Hb_node_membership_grp.Hb_node_list[node] = static_cast<Hb_Boolean>(value);
  }

  void set_leader(Hb_Adapter_Number leader, Hb_Incarnation incarnation) {
    group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_group_leader = leader;
    group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_group_incarnation = incarnation;
  }

  std::unique_ptr<Hb_Group> group = std::make_unique<Hb_Group>();
  Hb_Adapter_Identifier id = {777, 888, static_cast<Hb_Boolean>(999)};
};

inline bool untouched(const Hb_Adapter_Identifier& id) {
  return id.Hb_adapter_number == 777 && id.Hb_incarnation == 888 &&
         id.Hb_died_because_removed == static_cast<Hb_Boolean>(999);
}

// Number and incarnation have been written, and the flag has not.
inline testing::AssertionResult tells(const Hb_Adapter_Identifier& id, Hb_Adapter_Number adapter,
                                      Hb_Incarnation incarnation) {
  if (id.Hb_adapter_number == adapter && id.Hb_incarnation == incarnation &&
      id.Hb_died_because_removed == static_cast<Hb_Boolean>(999)) {
    return testing::AssertionSuccess();
  }
  return testing::AssertionFailure() << "the identifier is " << id.Hb_adapter_number << ", " << id.Hb_incarnation
                                     << ", " << id.Hb_died_because_removed;
}

inline Hb_Boolean adapter_in_group(Hb_Group* group, Hb_Adapter_Number adapter) {
  set_hb_errno(untouched_error);
  return hb_is_adapter_in_group(group, adapter);
}

inline int node_in_group(Hb_Group* group, Hb_Node_Number node) {
  set_hb_errno(untouched_error);
  return static_cast<int>(hb_is_node_in_group(group, node));
}

}  // namespace hb_test
