// Walking the members of a group.
#include <gmock/gmock.h>

#include "membership.h"
#include "platform_doubles.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST_F(Membership, AdaptersAreWalkedAscendingToTheEnd) {
  make_adapter_group(2);
  for (const Hb_Adapter_Number adapter : {31U, 0U, 7U}) member(adapter) = adapter + 100;
  group->Hb_cursor = 20;
  std::vector<Hb_Adapter_Number> walked;
  for (Hb_Rc rc = hb_get_first_adapter(group.get(), &id); rc == Hb_Success;
       rc = hb_get_next_adapter(group.get(), &id)) {
    walked.push_back(id.Hb_adapter_number);
    EXPECT_EQ(id.Hb_adapter_number + 100, id.Hb_incarnation);
    EXPECT_EQ(Hb_False, id.Hb_died_because_removed);
    EXPECT_EQ(static_cast<Hb_Cursor>(id.Hb_adapter_number) + 1, group->Hb_cursor);
  }
  EXPECT_THAT(walked, ElementsAre(0, 7, 31));
  EXPECT_EQ(1, hb_get_errno());
}

TEST_F(Membership, AtTheEndOfTheAdaptersTheOutputAndTheCursorStay) {
  make_adapter_group(2);
  member(7) = 70;
  hb_get_first_adapter(group.get(), &id);
  id = {777, 888, static_cast<Hb_Boolean>(999)};
  for (int call = 0; call < 3; ++call) {
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_adapter(group.get(), &id); }));
    EXPECT_TRUE(untouched(id));
    EXPECT_EQ(8, group->Hb_cursor);
  }
}

TEST_F(Membership, TheWalkTakesTheDiedBecauseRemovedBitOut) {
  make_adapter_group(1);
  member(7) = 0x08000005;
  member(8) = 0xF7FFFFFEU;
  member(9) = 0xFFFFFFFEU;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_adapter(group.get(), &id); }));
  EXPECT_EQ(5U, id.Hb_incarnation);
  EXPECT_EQ(Hb_True, id.Hb_died_because_removed);
  EXPECT_TRUE(succeeds([&] { return hb_get_next_adapter(group.get(), &id); }));
  EXPECT_EQ(0xF7FFFFFEU, id.Hb_incarnation);
  EXPECT_EQ(Hb_False, id.Hb_died_because_removed);
  EXPECT_TRUE(succeeds([&] { return hb_get_next_adapter(group.get(), &id); }));
  EXPECT_EQ(0xF7FFFFFEU, id.Hb_incarnation);
  EXPECT_EQ(Hb_True, id.Hb_died_because_removed);
}

TEST_F(Membership, AdaptersAtTheLimitOfTheClusterAreNotWalked) {
  make_adapter_group(1);
  member(32) = 1;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_adapter(group.get(), &id); }));
}

TEST_F(Membership, OnlyAnAdapterGroupIsWalkedByAdapter) {
  for (const int type : types_but_adapter_group) {
    make_adapter_group(1);
    member(7) = 1;
    group->Hb_cursor = 3;
    set_type(type);
    EXPECT_TRUE(fails_with(5, [&] { return hb_get_first_adapter(group.get(), &id); })) << type;
    EXPECT_TRUE(fails_with(5, [&] { return hb_get_next_adapter(group.get(), &id); })) << type;
    EXPECT_TRUE(untouched(id));
    EXPECT_EQ(3, group->Hb_cursor);
  }
}

TEST_F(Membership, AdaptersAreWalkedWhateverTheEvent) {
  for (const Hb_Events events : {0, 1, 2, 4, 8, 128, 512}) {
    make_adapter_group(events);
    member(7) = 1;
    EXPECT_TRUE(succeeds([&] { return hb_get_first_adapter(group.get(), &id); })) << events;
  }
}

TEST_F(Membership, NodesWithTheValueOneAreWalkedAscendingToTheEnd) {
  make_node_group(4);
  for (const size_t node : {7U, 0U, 3U}) set_node(node, 1);
  set_node(1, 2);
  set_node(2, -1);
  group->Hb_cursor = 5;
  std::vector<Hb_Node_Number> walked;
  Hb_Node_Number node = 0;
  for (Hb_Rc rc = hb_get_first_node(group.get(), &node); rc == Hb_Success; rc = hb_get_next_node(group.get(), &node)) {
    walked.push_back(node);
    EXPECT_EQ(node + 1, group->Hb_cursor);
  }
  EXPECT_THAT(walked, ElementsAre(0, 3, 7));
  EXPECT_EQ(-1, node);
  EXPECT_EQ(1, hb_get_errno());
  EXPECT_EQ(8, group->Hb_cursor);
  node = 99;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_node(group.get(), &node); }));
  EXPECT_EQ(-1, node);
}

TEST_F(Membership, ANodeWithTheValueTwoIsNotWalkedButIsInTheGroup) {
  make_node_group(4);
  set_node(3, 2);
  Hb_Node_Number node = 99;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_node(group.get(), &node); }));
  EXPECT_EQ(-1, node);
  EXPECT_EQ(2, node_in_group(group.get(), 3));
}

TEST_F(Membership, NodesAtTheMaximumAreNotWalked) {
  make_node_group(4);
  set_node(8, 1);
  Hb_Node_Number node = 99;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_node(group.get(), &node); }));
  EXPECT_EQ(-1, node);
}

TEST_F(Membership, OnlyANodeGroupIsWalkedByNode) {
  for (const int type : types_but_node_group) {
    make_node_group(4);
    set_node(3, 1);
    group->Hb_cursor = 3;
    set_type(type);
    Hb_Node_Number node = 99;
    EXPECT_TRUE(fails_with(5, [&] { return hb_get_first_node(group.get(), &node); })) << type;
    EXPECT_TRUE(fails_with(5, [&] { return hb_get_next_node(group.get(), &node); })) << type;
    EXPECT_EQ(99, node);
    EXPECT_EQ(3, group->Hb_cursor);
  }
}

ConfigurationMessage largest_cluster() { return ConfigurationMessage().max_nodes(2049).adapters_per_node(48); }

TEST_F(Membership, TheLastNodeOfTheLargestClusterIsWalkedAndTold) {
  reload(largest_cluster());
  make_node_group(1);
  set_node(2048, 1);
  Hb_Node_Number node = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_node(group.get(), &node); }));
  EXPECT_EQ(2048, node);
  EXPECT_EQ(2049, group->Hb_cursor);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_node(group.get(), &node); }));
  EXPECT_EQ(-1, node);
  EXPECT_EQ(1, node_in_group(group.get(), 2048));
  EXPECT_EQ(untouched_error, hb_get_errno());
  EXPECT_EQ(0, node_in_group(group.get(), 2049));
  EXPECT_EQ(4, hb_get_errno());
}

TEST_F(Membership, TheLastAdapterOfTheLargestClusterIsTold) {
  reload(largest_cluster());
  make_adapter_group(1);
  member(98351) = 3;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_id(group.get(), 98351, &id); }));
  EXPECT_TRUE(tells(id, 98351, 3));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_id(group.get(), 98352, &id); }));
}

struct Expected_Trace {
  uint32_t id;
  std::vector<uint32_t> values;
};

void expect_traces(const std::vector<Expected_Trace>& expected) {
  const std::vector<Recorded_Trace>& traces = platform_double().traces;
  ASSERT_EQ(expected.size(), traces.size());
  for (size_t index = 0; index < expected.size(); ++index) {
    EXPECT_EQ(expected[index].id, traces[index].id) << index;
    EXPECT_EQ(expected[index].values, traces[index].values) << index;
    EXPECT_EQ(2, traces[index].category) << index;
    EXPECT_EQ("_HBC", traces[index].component);
  }
}

TEST_F(Membership, AFoundAdapterIsTracedWithItsPositionAndTheNewCursor) {
  make_adapter_group(1);
  member(7) = 70;
  group->Hb_cursor = 3;
  trace_only(trace_debug);
  hb_get_next_adapter(group.get(), &id);
  expect_traces({{310, {1, 3}}, {312, {1, 7}}, {314, {8}}});
}

TEST_F(Membership, TheEndOfTheAdaptersIsTracedWithTheCursor) {
  make_adapter_group(1);
  group->Hb_cursor = 9;
  trace_only(trace_debug);
  hb_get_first_adapter(group.get(), &id);
  expect_traces({{310, {1, 9}}, {312, {0, 32}}, {313, {9}}});
}

TEST_F(Membership, ACursorOutsideTheListIsTracedAsItIsAndNothingIsFound) {
  for (const Hb_Cursor cursor : {-1, 98352}) {
    make_adapter_group(1);
    member(7) = 70;
    group->Hb_cursor = cursor;
    trace_only(trace_debug);
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_adapter(group.get(), &id); })) << cursor;
    const std::vector<Recorded_Trace>& traces = platform_double().traces;
    ASSERT_THAT(platform_double().trace_ids(), ElementsAre(310, 312, 313)) << cursor;
    EXPECT_THAT(traces[0].values, ElementsAre(1, static_cast<uint32_t>(cursor)));
    EXPECT_EQ(0U, traces[1].values[0]);
    EXPECT_THAT(traces[2].values, ElementsAre(static_cast<uint32_t>(cursor)));
  }
}

TEST_F(Membership, AGroupOfTheWrongTypeIsTracedWithTheErrorNumber) {
  make_node_group(1);
  group->Hb_cursor = 2;
  trace_only(trace_debug);
  hb_get_first_adapter(group.get(), &id);
  expect_traces({{310, {0, 2}}, {311, {0, 5}}});
}

TEST_F(Membership, TheAdapterWalkIsNotTracedWithTheDebugCategoryOff) {
  make_adapter_group(1);
  member(7) = 70;
  trace_only(trace_errors);
  hb_get_first_adapter(group.get(), &id);
  hb_get_next_adapter(group.get(), &id);
  make_node_group(1);
  hb_get_first_adapter(group.get(), &id);
  trace_only(trace_info);
  hb_get_first_adapter(group.get(), &id);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(Membership, TheNodeWalkIsNotTraced) {
  make_node_group(1);
  set_node(3, 1);
  trace_all();
  Hb_Node_Number node;
  hb_get_first_node(group.get(), &node);
  hb_get_next_node(group.get(), &node);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

}  // namespace
}  // namespace hb_test
