// From a queued event's group to a caller's.
#include <functional>

#include "handler_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

typedef void (EVMONHandler::*Copy)(Hb_Group*, Hb_Group*);

class Copying_Handler : public EVMONHandler {
 public:
  Copying_Handler() : EVMONHandler(&unused, nullptr) {}

 private:
  static int32_t unused;
};
int32_t Copying_Handler::unused = -1;

// A copy from a record of 0x33 bytes to one of 0x5A bytes. `expected` starts as the latter.
class GroupCopies : public HandlerState {
 protected:
  void SetUp() override {
    source->Hb_group_status = Hb_Group_Unstable;
    start_tracing();
  }

  void copy(Copy how) { (handler.*how)(source.get(), destination.get()); }

  // What every copy takes over.
  void expect_heading() {
    expected->Hb_group_status = Hb_Group_Unstable;
    expected->Hb_group_type = source->Hb_group_type;
    expected->Hb_events = source->Hb_events;
  }

  // The group, and so many entries of its list.
  void expect_adapters_copied(int entries) {
    copy(&EVMONHandler::copy_adapter_Hb_Group);
    expect_heading();
    Hb_Adapter_Membership_Grp& membership = expected->Hb_membership_grp_union.Hb_adapter_membership_grp;
    membership.Hb_group_incarnation = 0x33333333;
    membership.Hb_group_leader = 0x33333333;
    membership.Hb_num_adapters = 0x33333333;
    std::fill_n(membership.Hb_adapter_list, entries, 0x33333333U);
    EXPECT_TRUE(same_bytes(*destination, *expected));
  }

  Copying_Handler handler;
  std::unique_ptr<Hb_Group> source = group_of_bytes(0x33);
  std::unique_ptr<Hb_Group> destination = group_of_bytes(0x5A);
  std::unique_ptr<Hb_Group> expected = group_of_bytes(0x5A);
};

TEST_F(GroupCopies, OfAdaptersTakeTheEntriesOfTheConfigurationAndNoMore) {
  fill_table(global_config_tbl, 3, 2, {}, {});
  expect_adapters_copied(6);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(GroupCopies, OfAdaptersStayInTheRecordWhateverTheConfigurationSays) {
  global_config_tbl.Hb_max_nodes = 2049;
  global_config_tbl.Hb_adapters_per_node = 100000;
  copy(&EVMONHandler::copy_adapter_Hb_Group);
  expect_heading();
  Hb_Adapter_Membership_Grp& membership = expected->Hb_membership_grp_union.Hb_adapter_membership_grp;
  std::memset(&membership, 0x33, sizeof membership);
  EXPECT_TRUE(same_bytes(*destination, *expected));
}

TEST_F(GroupCopies, OfAdaptersTakeNoEntriesOfAConfigurationBelowZero) {
  global_config_tbl.Hb_max_nodes = -1;
  global_config_tbl.Hb_adapters_per_node = 3;
  expect_adapters_copied(0);
}

TEST_F(GroupCopies, OfNodesTakeAllEntries) {
  copy(&EVMONHandler::copy_node_Hb_Group);
  expect_heading();
  Hb_Node_Membership_Grp& membership = expected->Hb_membership_grp_union.Hb_node_membership_grp;
  static_assert(sizeof membership.Hb_node_list == 2049 * 4);
  std::memset(&membership, 0x33, sizeof membership);
  EXPECT_TRUE(same_bytes(*destination, *expected));
}

TEST_F(GroupCopies, OfASplitLeaveTheCallersNodeNumberOfTheLocalSite) {
  Hb_Site_Split_Info& to = destination->Hb_membership_grp_union.site_split_info;
  to.local_site.node_number = 77;
  to.remote_site.node_number = 78;
  copy(&EVMONHandler::copy_site_split_Hb_Group);
  expect_heading();
  Hb_Site_Split_Info& wanted = expected->Hb_membership_grp_union.site_split_info;
  std::memset(&wanted, 0x33, sizeof wanted);
  wanted.local_site.node_number = 77;
  EXPECT_TRUE(same_bytes(*destination, *expected));
}

TEST_F(GroupCopies, OfAMergeLeaveTheCallersNodeNumberOfTheLocalSite) {
  Hb_Site_Merge_Info& to = destination->Hb_membership_grp_union.site_merge_info;
  to.local_site.node_number = 77;
  to.remote_site.node_number = 78;
  copy(&EVMONHandler::copy_site_merge_Hb_Group);
  expect_heading();
  Hb_Site_Merge_Info& wanted = expected->Hb_membership_grp_union.site_merge_info;
  std::memset(&wanted, 0x33, sizeof wanted);
  wanted.local_site.node_number = 77;
  EXPECT_TRUE(same_bytes(*destination, *expected));
}

TEST_F(GroupCopies, OfASiteHaveEachFieldInItsPlace) {
  Hb_Site_Info& from = source->Hb_membership_grp_union.site_split_info.remote_site;
  from = {{1, 2}, 3, {4, 5}, 6, 7, 8, 9, {10, 11}};
  copy(&EVMONHandler::copy_site_split_Hb_Group);
  const Hb_Site_Info to = destination->Hb_membership_grp_union.site_split_info.remote_site;
  EXPECT_EQ(uint64_t{to.node_id.high}, 1U);
  EXPECT_EQ(uint64_t{to.node_id.low}, 2U);
  EXPECT_EQ(uint32_t{to.node_number}, 3U);
  EXPECT_EQ(uint64_t{to.site_id.high}, 4U);
  EXPECT_EQ(uint64_t{to.site_id.low}, 5U);
  EXPECT_EQ(uint32_t{to.site_number}, 6U);
  EXPECT_EQ(uint32_t{to.site_priority}, 7U);
  EXPECT_EQ(uint32_t{to.site_policy}, 8U);
  EXPECT_EQ(uint32_t{to.site_merge_flag}, 9U);
  EXPECT_EQ(uint64_t{to.cluster_id.high}, 10U);
  EXPECT_EQ(uint64_t{to.cluster_id.low}, 11U);
}

struct Missing_Group {
  const char* description;
  Copy copy;
  const char* trace;
};

class GroupCopiesWithoutAGroup : public GroupCopies, public testing::WithParamInterface<Missing_Group> {};

TEST_P(GroupCopiesWithoutAGroup, DoNothingButTellSo) {
  const Copy how = GetParam().copy;
  (handler.*how)(nullptr, destination.get());
  (handler.*how)(source.get(), nullptr);
  (handler.*how)(nullptr, nullptr);
  EXPECT_THAT(trace_lines(), ElementsAre(GetParam().trace, GetParam().trace, GetParam().trace));
  EXPECT_TRUE(same_bytes(*destination, *expected));
}

TEST_P(GroupCopiesWithoutAGroup, AreSilentWithoutInfoTracing) {
  platform_double().set_levels({1, 0, 1});
  const Copy how = GetParam().copy;
  (handler.*how)(nullptr, destination.get());
  EXPECT_THAT(trace_lines(), IsEmpty());
  EXPECT_TRUE(same_bytes(*destination, *expected));
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, GroupCopiesWithoutAGroup,
    testing::Values(Missing_Group{"Adapters", &EVMONHandler::copy_adapter_Hb_Group, "Info 67"},
                    Missing_Group{"Nodes", &EVMONHandler::copy_node_Hb_Group, "Info 66"},
                    Missing_Group{"SiteSplit", &EVMONHandler::copy_site_split_Hb_Group, "Info 214"},
                    Missing_Group{"SiteMerge", &EVMONHandler::copy_site_merge_Hb_Group, "Info 214"}),
    [](const auto& test) { return test.param.description; });

}  // namespace
}  // namespace hb_test
