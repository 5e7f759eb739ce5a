// What each type of group does with each kind of member.
#include <gmock/gmock.h>

#include <ostream>

#include "subscription_record.h"

namespace hb_test {
namespace {

using testing::IsEmpty;

enum class Effect { proceed, refuse, reset };

struct Worker {
  const char* name;
  Hb_Rc (*add)(Hb_Subscription_Group* group);
  Hb_Rc (*remove)(Hb_Subscription_Group* group);
  std::vector<size_t> members;
  int32_t reset_type;
  size_t reset_length;
};

const Worker workers[] = {
    {"Adapter",
     [](Hb_Subscription_Group* group) { return hb_add_adapter_to_subscription_group(group, 13); },
     [](Hb_Subscription_Group* group) { return hb_remove_adapter_from_subscription_group(group, 13); },
     {13},
     2,
     12294},
    {"Network",
     [](Hb_Subscription_Group* group) { return hb_add_network_to_subscription_group(group, 1); },
     [](Hb_Subscription_Group* group) { return hb_remove_network_from_subscription_group(group, 1); },
     {13, 17},
     5,
     12294},
    {"Node",
     [](Hb_Subscription_Group* group) { return hb_add_node_to_subscription_group(group, 3); },
     [](Hb_Subscription_Group* group) { return hb_remove_node_from_subscription_group(group, 3); },
     {3},
     0,
     257},
    {"Site",
     [](Hb_Subscription_Group* group) { return hb_add_site_to_subscription_group(group, 1); },
     [](Hb_Subscription_Group* group) { return hb_remove_site_from_subscription_group(group, 1); },
     {1},
     7,
     1},
};

constexpr Effect proceed = Effect::proceed;
constexpr Effect refuse = Effect::refuse;
constexpr Effect reset = Effect::reset;

const Effect effects[10][4] = {
    // adapter, network, node, site
    {refuse, refuse, proceed, refuse},     // 0 nodes
    {proceed, proceed, proceed, proceed},  // 1 all nodes
    {proceed, refuse, refuse, refuse},     // 2 adapters
    {proceed, proceed, proceed, proceed},  // 3 all adapters
    {reset, reset, reset, reset},          // 4 empty
    {proceed, refuse, proceed, proceed},   // 5 network
    {proceed, proceed, proceed, proceed},  // 6 different instance
    {refuse, refuse, refuse, proceed},     // 7 sites
    {proceed, proceed, proceed, proceed},  // 8 all sites
    {proceed, proceed, proceed, proceed},  // 9 split and merge
};

struct Table_Cell {
  int32_t type;
  size_t worker;
};

void PrintTo(const Table_Cell& cell, std::ostream* stream) {
  *stream << workers[cell.worker].name << " on type " << cell.type;
}

std::vector<Table_Cell> cells_with(Effect effect) {
  std::vector<Table_Cell> cells;
  for (int32_t type = 0; type <= 9; ++type) {
    for (size_t worker = 0; worker < 4; ++worker) {
      if (effects[type][worker] == effect) cells.push_back({type, worker});
    }
  }
  return cells;
}

std::string name_of_cell(const testing::TestParamInfo<Table_Cell>& test) {
  return std::string(workers[test.param.worker].name) + "OnType" + std::to_string(test.param.type);
}

class TypeTable : public Subscription, public testing::WithParamInterface<Table_Cell> {
 protected:
  const Worker& worker = workers[GetParam().worker];
  int32_t type = GetParam().type;
};

void expect_type_refused(const Worker& worker, int32_t type) {
  Hb_Subscription_Group group = group_filled_with(0x5A, type);
  const Hb_Subscription_Group before = group;
  EXPECT_TRUE(fails_with(11, [&] { return worker.add(&group); })) << worker.name << " on type " << type;
  EXPECT_TRUE(fails_with(11, [&] { return worker.remove(&group); })) << worker.name << " on type " << type;
  EXPECT_TRUE(same_bytes(before, group)) << worker.name << " on type " << type;
}

class RefusingTypes : public TypeTable {};

TEST_P(RefusingTypes, FailAndLeaveTheGroup) { expect_type_refused(worker, type); }

TEST_F(Subscription, TypesThatNoGroupHasAreRefused) {
  for (const Worker& worker : workers) {
    for (const int32_t type : odd_types) expect_type_refused(worker, type);
  }
}

INSTANTIATE_TEST_SUITE_P(Subscription, RefusingTypes, testing::ValuesIn(cells_with(refuse)), name_of_cell);

class ProceedingTypes : public TypeTable {};

TEST_P(ProceedingTypes, SetTheBitsAndCountThemAndKeepTheType) {
  Hb_Subscription_Group group = group_of_type(type);
  set_count(group, 40);
  Hb_Subscription_Group expected = group;
  for (const size_t member : worker.members) set_member(expected, member);
  set_count(expected, 40 + static_cast<int32_t>(worker.members.size()));
  EXPECT_TRUE(succeeds([&] { return worker.add(&group); }));
  EXPECT_TRUE(same_bytes(expected, group));
  EXPECT_TRUE(succeeds([&] { return worker.add(&group); }));
  EXPECT_TRUE(same_bytes(expected, group));
}

TEST_P(ProceedingTypes, ClearTheBitsAndCountThemDownAndKeepTheType) {
  Hb_Subscription_Group expected = group_of_type(type);
  set_count(expected, 40);
  Hb_Subscription_Group group = expected;
  for (const size_t member : worker.members) set_member(group, member);
  set_count(group, 40 + static_cast<int32_t>(worker.members.size()));
  EXPECT_TRUE(succeeds([&] { return worker.remove(&group); }));
  EXPECT_TRUE(same_bytes(expected, group));
  EXPECT_TRUE(succeeds([&] { return worker.remove(&group); }));
  EXPECT_TRUE(same_bytes(expected, group));
}

INSTANTIATE_TEST_SUITE_P(Subscription, ProceedingTypes, testing::ValuesIn(cells_with(proceed)), name_of_cell);

class ResettingTypes : public TypeTable {
 protected:
  void expect_reset(const Hb_Subscription_Group& group) const {
    EXPECT_EQ(worker.reset_type, group.Hb_subscription_type);
    EXPECT_EQ(0xFF, set_byte(group, worker.reset_length));
    expect_header_untouched(group);
  }
};

TEST_P(ResettingTypes, ClearTheSetTakeTheTypeAndAdd) {
  Hb_Subscription_Group group = group_filled_with(0xFF, type);
  EXPECT_TRUE(succeeds([&] { return worker.add(&group); }));
  expect_reset(group);
  EXPECT_EQ(worker.members, members_of(group, worker.reset_length));
  EXPECT_EQ(static_cast<int32_t>(worker.members.size()), count_of(group));
}

TEST_P(ResettingTypes, ClearTheSetTakeTheTypeAndRemoveNothing) {
  Hb_Subscription_Group group = group_filled_with(0xFF, type);
  EXPECT_TRUE(succeeds([&] { return worker.remove(&group); }));
  expect_reset(group);
  EXPECT_THAT(members_of(group, worker.reset_length), IsEmpty());
  EXPECT_EQ(0, count_of(group));
}

INSTANTIATE_TEST_SUITE_P(Subscription, ResettingTypes, testing::ValuesIn(cells_with(reset)), name_of_cell);

}  // namespace
}  // namespace hb_test
