#include "support/group_check.h"

#include <cstdlib>
#include <cstring>

#include "hb_client.h"
#include "support/walk_check.h"

static bool operator==(const Hb_Adapter_Identifier& a, const Hb_Adapter_Identifier& b) {
  return a.Hb_adapter_number == b.Hb_adapter_number && a.Hb_incarnation == b.Hb_incarnation &&
         a.Hb_died_because_removed == b.Hb_died_because_removed;
}

namespace fuzz {

namespace {

constexpr Hb_Events death = 1;
constexpr Hb_Events join = 2;
constexpr Hb_Events new_group = 4;
constexpr Hb_Events failure_data = 8;
constexpr Hb_Events different_instance = 256;

const Hb_Adapter_Membership_Grp& adapters_of(const Hb_Group& group) {
  return group.Hb_membership_grp_union.Hb_adapter_membership_grp;
}

const Hb_Boolean* nodes_of(const Hb_Group& group) {
  return group.Hb_membership_grp_union.Hb_node_membership_grp.Hb_node_list;
}

int error_of_type(const Hb_Group& group, int32_t type) {
  return group.Hb_group_type == type ? no_error : int{HB_EGROUPTYPE};
}

void check_identity(Hb_Group& group) {
  const int type_error = error_of_type(group, Hb_Adapter_Group);
  const int event_error = group.Hb_events == new_group ? no_error : int{HB_EWRONGSTATE};
  const int error = type_error != no_error ? type_error : event_error;
  const Hb_Adapter_Number leader = adapters_of(group).Hb_group_leader;
  Hb_Adapter_Identifier id{};
  expect(error, [&] { return hb_get_group_id(&group, &id); });
  REQUIRE(error != no_error ||
          (id.Hb_adapter_number == leader && id.Hb_incarnation == adapters_of(group).Hb_group_incarnation));
  expect(error, [&] { return hb_get_group_leader_id(&group, &id); });
  REQUIRE(error != no_error || leader >= HB_MAX_ADAPTERS ||
          (id.Hb_adapter_number == leader && id.Hb_incarnation == adapters_of(group).Hb_adapter_list[leader]));
  Hb_Group_Status status{};
  expect(event_error, [&] { return hb_get_group_status(&group, &status); });
  REQUIRE(event_error != no_error || status == group.Hb_group_status);
}

// The two predicates return what they found; the error number tells a False that is an error.
void expect_value(int error, int32_t value, int32_t expected) {
  REQUIRE(value == (error == no_error ? expected : int32_t{Hb_False}));
  REQUIRE(hb_get_errno() == (error == no_error ? no_number : error));
}

void check_adapter(Hb_Group& group, uint32_t limit, Hb_Adapter_Number adapter) {
  const int error = adapter >= limit ? int{HB_EINVAL} : error_of_type(group, Hb_Adapter_Group);
  const Hb_Incarnation value = error == no_error ? adapters_of(group).Hb_adapter_list[adapter] : 0;
  const bool is_member = value != 0xFFFFFFFFU;
  set_hb_errno(no_number);
  expect_value(error, hb_is_adapter_in_group(&group, adapter), is_member ? Hb_True : Hb_False);
  Hb_Adapter_Identifier id{};
  expect(error == no_error && !is_member ? int{HB_ENOADAPTER} : error,
         [&] { return hb_get_adapter_id(&group, adapter, &id); });
  REQUIRE(error != no_error || !is_member || (id.Hb_adapter_number == adapter && id.Hb_incarnation == value));
}

void check_node(Hb_Group& group, int limit, Hb_Node_Number node) {
  const int error = node < 0 || node >= limit ? int{HB_EINVAL} : error_of_type(group, Hb_Node_Group);
  set_hb_errno(no_number);
  const int32_t found = hb_is_node_in_group(&group, node);
  expect_value(error, found, error == no_error ? nodes_of(group)[node] : Hb_False);
}

Hb_Adapter_Identifier walked(Hb_Adapter_Number adapter, Hb_Incarnation value) {
  return {adapter, value & 0xF7FFFFFFU, (value & 0x08000000U) != 0 ? Hb_True : Hb_False};
}

constexpr Hb_Adapter_Identifier unwritten = {4711, 4711, Hb_False};

// At the end the output stays as it was, so each step starts with the same one.
void walk_adapters(Hb_Group& group, uint32_t limit, Hb_Cursor hostile) {
  static Expected<Hb_Adapter_Identifier> expected;
  expected.clear();
  for (uint32_t adapter = 0; adapter < limit; ++adapter) {
    const Hb_Incarnation value = adapters_of(group).Hb_adapter_list[adapter];
    if (value != 0xFFFFFFFFU) {
      expected.add(static_cast<int>(adapter), walked(adapter, value));
    }
  }
  Hb_Adapter_Identifier id{};
  const auto step = [&id, &group](Hb_Rc (*call)(Hb_Group*, Hb_Adapter_Identifier*)) {
    id = unwritten;
    return call(&group, &id);
  };
  check_walk(
      expected, unwritten, id, group.Hb_cursor, hostile, [&] { return step(hb_get_first_adapter); },
      [&] { return step(hb_get_next_adapter); });
}

void walk_nodes(Hb_Group& group, int limit, Hb_Cursor hostile) {
  static Expected<Hb_Node_Number> expected;
  expected.clear();
  for (int node = 0; node < limit; ++node) {
    if (nodes_of(group)[node] == 1) {
      expected.add(node, static_cast<Hb_Node_Number>(node));
    }
  }
  Hb_Node_Number node = 0;
  check_walk(
      expected, HB_NO_NODE, node, group.Hb_cursor, hostile, [&] { return hb_get_first_node(&group, &node); },
      [&] { return hb_get_next_node(&group, &node); });
}

// A few steps from the hostile cursor on, without knowing the members.
void walk_a_little(Hb_Group& group, uint32_t limit, Hb_Cursor hostile) {
  Hb_Adapter_Identifier id{};
  group.Hb_cursor = hostile;
  for (int i = 0; i < 3; ++i) {
    const Hb_Cursor before = group.Hb_cursor;
    if (expect_one_of({HB_ENOMORE}, [&] { return hb_get_next_adapter(&group, &id); }) == Hb_Failure) {
      REQUIRE(group.Hb_cursor == before);
      return;
    }
    REQUIRE(id.Hb_adapter_number < limit && before >= 0 && group.Hb_cursor > before);
    REQUIRE(id == walked(id.Hb_adapter_number, adapters_of(group).Hb_adapter_list[id.Hb_adapter_number]));
  }
}

void check_walks(Hb_Group& group, const Group_Limits& limits, Hb_Cursor hostile, bool whole_walks) {
  Hb_Adapter_Identifier id{};
  Hb_Node_Number node = 0;
  if (group.Hb_group_type != Hb_Adapter_Group) {
    expect(HB_EGROUPTYPE, [&] { return hb_get_first_adapter(&group, &id); });
    expect(HB_EGROUPTYPE, [&] { return hb_get_next_adapter(&group, &id); });
  } else if (whole_walks) {
    walk_adapters(group, limits.adapters, hostile);
  } else {
    walk_a_little(group, limits.adapters, hostile);
  }
  if (group.Hb_group_type != Hb_Node_Group) {
    expect(HB_EGROUPTYPE, [&] { return hb_get_first_node(&group, &node); });
    expect(HB_EGROUPTYPE, [&] { return hb_get_next_node(&group, &node); });
  } else {
    walk_nodes(group, limits.nodes, hostile);
  }
}

void check_failure_data(Hb_Group& group) {
  const Hb_Events events = group.Hb_events;
  const bool carries_id = (events == death || events == join || events == failure_data) && group.Hb_ffdc_id[0] != '\0';
  Hb_FFDC_Id id = {};
  expect(carries_id ? no_error : int{HB_EWRONGSTATE}, [&] { return hb_get_FFDC_id(&group, &id); });
  REQUIRE(!carries_id || std::memcmp(id, group.Hb_ffdc_id, 43) == 0);
}

template <typename Record>
void check_copy(Hb_Rc (*getter)(Hb_Group*, Record*), Hb_Group& group, Record& record) {
  expect(no_error, [&] { return getter(&group, &record); });
  REQUIRE(std::memcmp(&record, &group.Hb_membership_grp_union, sizeof record) == 0);
}

// The pointers of a record that came as bytes are none: they are replaced before the record is released.
void check_splits_and_merges(Hb_Group& group) {
  Hb_Site_Split_Info split;
  check_copy(hb_get_site_split_info, group, split);
  Hb_Site_Merge_Info merge;
  check_copy(hb_get_site_merge_info, group, merge);
  Hb_Split_Merge_Info info;
  check_copy(hb_get_merge_info, group, info);
  check_copy(hb_get_split_info, group, info);
  info.local_subcluster.node_numbers = static_cast<uint32_t*>(std::malloc(sizeof(uint32_t)));
  info.remote_subcluster.node_numbers = nullptr;
  hb_free_split_info(&info);
  REQUIRE(info.local_subcluster.node_numbers == nullptr);
  hb_free_merge_info(&info);
  expect(no_error, [&] { return hb_site_down(&group); });
  expect(no_error, [&] { return hb_site_merge(&group); });
}

void check_sender(Hb_Group& group) {
  const bool carries_sender = group.Hb_events == different_instance && group.Hb_group_type == Hb_Diff_Instance_Type;
  Hb_Diff_Instance_Info sender{};
  expect(carries_sender ? no_error : int{HB_EWRONGSTATE},
         [&] { return hb_get_different_instance_sender(&group, &sender); });
  REQUIRE(!carries_sender || std::memcmp(&sender, &group.Hb_membership_grp_union, 20) == 0);
}

void check_identifier(const Hostile& hostile) {
  Hb_Adapter_Identifier id = {hostile.adapter, static_cast<uint32_t>(hostile.offset),
                              static_cast<Hb_Boolean>(hostile.cursor)};
  set_hb_errno(no_number);
  REQUIRE(hb_has_adapter_died_because_removed(&id) == static_cast<Hb_Boolean>(hostile.cursor));
  REQUIRE(hb_adapter_incarnation(&id) == static_cast<uint32_t>(hostile.offset));
  REQUIRE(hb_get_errno() == no_number);
}

}  // namespace

void check_group(Hb_Group& group, const Group_Limits& limits, const Hostile& hostile, bool whole_walks) {
  check_identity(group);
  check_adapter(group, limits.adapters, hostile.adapter);
  check_node(group, limits.nodes, hostile.node);
  check_walks(group, limits, hostile.cursor, whole_walks);
  check_failure_data(group);
  check_sender(group);
  check_splits_and_merges(group);
  check_identifier(hostile);
}

}  // namespace fuzz
