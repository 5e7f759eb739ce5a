// Splits and merges of the cluster: both parts for the caller, and the deaths of the other one.
#include <fcntl.h>

#include <cstdlib>

#include "VEX_EVMONNodeLivenessHandler.h"
#include "monitored_cluster.h"
#include "support/allocation_faults.h"

namespace {

// The node numbers are the C allocator's. Calls of calloc from the library that fail: the n-th from now on.
int calloc_fails_at = 0;
int calloc_calls = 0;

}  // namespace

extern "C" void* __real_calloc(size_t count, size_t size);
extern "C" void* __wrap_calloc(size_t count, size_t size);
void* __wrap_calloc(size_t count, size_t size) {
  if (calloc_fails_at != 0 && ++calloc_calls == calloc_fails_at) {
    errno = ENOMEM;
    return nullptr;
  }
  return __real_calloc(count, size);
}

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

constexpr uint64_t sequence = 0x900000005;

using Numbers = std::vector<uint32_t>;

class SplitMerge : public MonitorTest<EVMONNodeLivenessHandler> {
 protected:
  SplitMerge() { Monitored_Client::subscribe(); }
  ~SplitMerge() override {
    if (has_lists) hb_free_split_info(&info_of());
  }

  zu_evm_event_split_merge_cfg_t report(zu_evm_event_type_t type) {
    zu_evm_event_split_merge_cfg_t record = {};
    record.event_type = type;
    record.node_number = 1;
    record.sequence_number = sequence;
    record.reason_number = 31;
    record.num_local_node_up = static_cast<uint32_t>(local.size());
    record.num_remote_node_up = static_cast<uint32_t>(remote.size());
    record.local_node_numbers = local.empty() ? nullptr : local.data();
    record.remote_node_numbers = remote.empty() ? nullptr : remote.data();
    return record;
  }
  Hb_Rc tell(zu_evm_event_split_merge_cfg_t record) {
    const Hb_Rc rc = monitor.SplitMergeEventHandler(&record, &out.events, out.name, out.group.get(), &out.sequence);
    has_lists = out.events != 0x7A && (rc == Hb_Success || !Monitored_Client::queue().empty());
    return rc;
  }
  Hb_Rc split() { return tell(report(ZU_EVM_SUBCLUSTER_SPLIT)); }
  Hb_Rc merge() { return tell(report(ZU_EVM_SUBCLUSTER_MERGE)); }

  Hb_Split_Merge_Info& info_of() { return out.group->Hb_membership_grp_union.split_info; }
  static Numbers numbers(const Hb_Subcluster_Info& part) {
    return {part.node_numbers, part.node_numbers + part.num_up_nodes};
  }
  void expect_parts(const Numbers& here, const Numbers& there) {
    EXPECT_EQ(here, numbers(info_of().local_subcluster));
    EXPECT_EQ(there, numbers(info_of().remote_subcluster));
    EXPECT_EQ(0U, info_of().subtype);
    EXPECT_EQ(Hb_Subcluster_Group, out.group->Hb_group_type);
    EXPECT_EQ(Hb_Group_Stable, out.group->Hb_group_status);
    EXPECT_EQ(out.events, out.group->Hb_events);
  }
  void expect_all_up() {
    for (uint32_t node = 1; node <= 4; ++node) {
      EXPECT_THAT(Monitored_Client::state_of(node), Pair(Hb_Entity_Up, Hb_Entity_State_Reason_Up));
      EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(node, 0));
    }
    EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
    EXPECT_EQ(0, client.bytes_in_pipe());
  }

  // Fails as where there is no memory for a list; the local one is given back or was not made.
  void expect_no_room(const zu_evm_event_split_merge_cfg_t& record) {
    Monitored_Client::forget_traces();
    set_hb_errno(no_number);
    EXPECT_EQ(Hb_Failure, tell(record));
    EXPECT_EQ(17, hb_get_errno());
    EXPECT_EQ(5U, out.sequence);
    EXPECT_EQ(record.event_type == ZU_EVM_SUBCLUSTER_SPLIT ? 4096 : 8192, out.events);
    EXPECT_EQ(nullptr, info_of().local_subcluster.node_numbers);
    EXPECT_EQ(0U, info_of().local_subcluster.num_up_nodes);
    EXPECT_THAT(traced(), ElementsAre(Pair(254U, info), Pair(256U, info), Pair(262U, errors), Pair(255U, info)));
    EXPECT_EQ(static_cast<uint32_t>(ENOMEM), platform_double().traces_of(262)[0].block_value(0));
    expect_all_up();
  }

  Numbers local = {1, 2};
  Numbers remote = {4, 3};
  bool has_lists = false;
};

// Splits.

TEST_F(SplitMerge, ASplitGivesBothPartsToTheCaller) {
  EXPECT_EQ(Hb_Success, split());
  EXPECT_EQ(4096, out.events);
  EXPECT_EQ("splits", name());
  EXPECT_EQ(5U, out.sequence);
  expect_parts({1, 2}, {4, 3});
}

TEST_F(SplitMerge, TheListsAreTheCallersOwn) {
  split();
  // Copied out first, as the record has them at multiples of 4 only.
  const uint32_t* const here = info_of().local_subcluster.node_numbers;
  const uint32_t* const there = info_of().remote_subcluster.node_numbers;
  EXPECT_NE(local.data(), here);
  EXPECT_NE(remote.data(), there);
  hb_free_split_info(&info_of());
  EXPECT_EQ(nullptr, info_of().local_subcluster.node_numbers);
  EXPECT_EQ(nullptr, info_of().remote_subcluster.node_numbers);
}

TEST_F(SplitMerge, ASplitTakesTheNodesOfTheOtherPartDown) {
  split();
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_LOCAL_SPLIT_Down));
  EXPECT_THAT(Monitored_Client::state_of(4), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_LOCAL_SPLIT_Down));
  EXPECT_EQ(4, Hb_Entity_State_Reason_LOCAL_SPLIT_Down);
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of(1).first);
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of(2).first);
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
}

TEST_F(SplitMerge, ASplitQueuesTheNodesInOneEventAndTheAdaptersOfEachInTheirOrder) {
  split();
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3, 4}, 2}, Queued_Event{1, {adapter(4, 0), adapter(4, 1)}, 2},
                          Queued_Event{1, {adapter(3, 0), adapter(3, 1)}, 2}));
  EXPECT_EQ(1, client.bytes_in_pipe());
}

TEST_F(SplitMerge, TheCountOfTheDeathIsThatOfTheOtherPartWhoeverWasUp) {
  Monitored_Client::mark(4, Hb_Entity_Down, Hb_Entity_State_Reason_STOPPED_Down);
  remote = {4, 99, 3};
  EXPECT_EQ(Hb_Success, split());
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3}, 3}, Queued_Event{1, {adapter(3, 0), adapter(3, 1)}, 2}));
  EXPECT_THAT(Monitored_Client::state_of(4), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_STOPPED_Down));
  EXPECT_THAT(numbers_of(264), ElementsAre(4, 2));
  EXPECT_THAT(numbers_of(265), ElementsAre(99));
}

TEST_F(SplitMerge, WithoutMemoryForAnIndexOfTheAdaptersTheDeathsAreTheSame) {
  Monitored_Client::trace_nothing();
  for (const size_t nth : {2U, 3U}) {
    {
      const AllocationFailure failure(nth);
      EXPECT_EQ(Hb_Success, split());
      EXPECT_TRUE(failure.happened());
    }
    EXPECT_THAT(Monitored_Client::queue(),
                ElementsAre(Queued_Event{1, {3, 4}, 2}, Queued_Event{1, {adapter(4, 0), adapter(4, 1)}, 2},
                            Queued_Event{1, {adapter(3, 0), adapter(3, 1)}, 2}));
    hb_free_split_info(&info_of());
    Monitored_Client::drop_queue();
    for (const uint32_t node : {3U, 4U}) Monitored_Client::mark(node, Hb_Entity_Up, Hb_Entity_State_Reason_Up);
  }
  has_lists = false;
}

TEST_F(SplitMerge, RecordsTheAdaptersOfEachNodeInTheirOrder) {
  remote = {2, 4, 3};
  Monitored_Client::mark_adapters(4, Hb_Entity_Down);
  split();
  std::vector<uint32_t> adapters;
  for (const Recorded_Trace& goes_down : platform_double().traces_of(79)) {
    adapters.push_back(goes_down.block_value(1));
  }
  EXPECT_THAT(adapters, ElementsAre(adapter(2, 0), adapter(2, 1), adapter(3, 0), adapter(3, 1)));
  const std::vector<Recorded_Trace> counts = platform_double().traces_of(84);
  ASSERT_EQ(3U, counts.size());
  EXPECT_THAT(counts[0].values, ElementsAre(1U, 2U));
  EXPECT_THAT(counts[1].values, ElementsAre(1U, 0U));
  EXPECT_THAT(counts[2].values, ElementsAre(1U, 2U));
}

TEST_F(SplitMerge, ANodeWithoutAdaptersUpHasNoAdapterEvent) {
  Monitored_Client::mark_adapters(4, Hb_Entity_Down);
  split();
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3, 4}, 2}, Queued_Event{1, {adapter(3, 0), adapter(3, 1)}, 2}));
}

TEST_F(SplitMerge, ASplitInWhichNobodyOfTheOtherPartIsUpQueuesNothing) {
  remote = {};
  EXPECT_EQ(Hb_Success, split());
  EXPECT_EQ(4096, out.events);
  expect_parts({1, 2}, {});
  expect_all_up();
}

TEST_F(SplitMerge, ASplitOfNodesThatAreDownQueuesNothing) {
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  Monitored_Client::mark(4, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  EXPECT_EQ(Hb_Success, split());
  EXPECT_EQ(4096, out.events);
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
  EXPECT_EQ(0, client.bytes_in_pipe());
}

TEST_F(SplitMerge, ANodeThatIsNamedTwiceDiesOnce) {
  remote = {3, 3};
  split();
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3}, 2}, Queued_Event{1, {adapter(3, 0), adapter(3, 1)}, 2}));
  EXPECT_THAT(numbers_of(264), ElementsAre(3, 2));
}

TEST_F(SplitMerge, TheDeathsHoldAlsoInATableThatWaitsToTakeEffect) {
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, &global_config_tbl, nullptr));
  split();
  Monitored_Client::take_configuration();
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_LOCAL_SPLIT_Down));
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(4, 1));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(2, 1));
}

TEST_F(SplitMerge, FailsWhenTheCallerCannotBeWokenAndTellsTheSplitAllTheSame) {
  client.remove_event_pipe();
  EXPECT_EQ(Hb_Failure, split());
  EXPECT_EQ(90, hb_get_errno());
  EXPECT_EQ(4096, out.events);
  EXPECT_EQ("splits", name());
  expect_parts({1, 2}, {4, 3});
  EXPECT_EQ(3U, Monitored_Client::queue().size());
}

TEST_F(SplitMerge, FailsWhenThePipeCannotBeWrittenAndTellsTheSplitAllTheSame) {
  const int unwritable = open("/dev/null", O_RDONLY | O_CLOEXEC);
  ASSERT_EQ(client.pipe_handler->getWriteFd(), dup2(unwritable, client.pipe_handler->getWriteFd()));
  close(unwritable);
  EXPECT_EQ(Hb_Failure, split());
  EXPECT_EQ(EBADF, errno);
  EXPECT_EQ(59, hb_get_errno());
  EXPECT_EQ(4096, out.events);
  expect_parts({1, 2}, {4, 3});
  EXPECT_EQ(3U, Monitored_Client::queue().size());
}

// Merges and other records.

TEST_F(SplitMerge, AMergeGivesBothPartsAndChangesNoNode) {
  EXPECT_EQ(Hb_Success, merge());
  EXPECT_EQ(8192, out.events);
  EXPECT_EQ("splits", name());
  EXPECT_EQ(5U, out.sequence);
  expect_parts({1, 2}, {4, 3});
  expect_all_up();
  EXPECT_EQ(0U, times_traced(263));
}

TEST_F(SplitMerge, AMergeLeavesNodesDownThatAre) {
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LOCAL_SPLIT_Down);
  merge();
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_LOCAL_SPLIT_Down));
}

TEST_F(SplitMerge, WithoutASubscriptionIsNoEventButFillsTheLists) {
  splitMergeEventSubscriptionName[0] = '\0';
  EXPECT_EQ(Hb_Success, split());
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("<EMPTY EVENT>", name());
  EXPECT_EQ(5U, out.sequence);
  expect_parts({1, 2}, {4, 3});
  EXPECT_THAT(platform_double().traces_of(259), testing::SizeIs(1));
  EXPECT_EQ(3U, Monitored_Client::queue().size());
}

TEST_F(SplitMerge, OfAnyOtherTypeFillsNoLists) {
  EXPECT_EQ(Hb_Success, tell(report(ZU_EVM_EVENT_DOWN)));
  has_lists = false;
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("splits", name());
  EXPECT_EQ(Hb_Subcluster_Group, out.group->Hb_group_type);
  EXPECT_EQ(0, out.group->Hb_events);
  EXPECT_EQ(0x5A5A5A5AU, info_of().local_subcluster.num_up_nodes);
  EXPECT_EQ(0x5A5A5A5AU, info_of().remote_subcluster.num_up_nodes);
  expect_all_up();
}

TEST_F(SplitMerge, OfAnyOtherTypeIsNotRefusedForItsLists) {
  auto record = report(ZU_EVM_EVENT_UP);
  record.local_node_numbers = record.remote_node_numbers = nullptr;
  EXPECT_EQ(Hb_Success, tell(record));
  record.num_local_node_up = record.num_remote_node_up = minus_one;
  EXPECT_EQ(Hb_Success, tell(record));
  has_lists = false;
  EXPECT_EQ(5U, out.sequence);
  EXPECT_EQ("splits", name());
  EXPECT_EQ(0x5A5A5A5AU, info_of().subtype);
}

TEST_F(SplitMerge, OfASubtypeThatNobodyKnowsIsToldWithIt) {
  auto record = report(ZU_EVM_SUBCLUSTER_SPLIT);
  record.event_subtype = static_cast<zu_evm_splitmerge_event_subtype_t>(7);
  EXPECT_EQ(Hb_Success, tell(record));
  EXPECT_EQ(4096, out.events);
  EXPECT_EQ(7U, info_of().subtype);
  EXPECT_EQ(2U, info_of().remote_subcluster.num_up_nodes);
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_LOCAL_SPLIT_Down));
}

TEST_F(SplitMerge, OfTheOtherPartIsRefusedBehindItsSequenceNumber) {
  auto record = report(ZU_EVM_SUBCLUSTER_SPLIT);
  record.event_subtype = ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_REMOTE;
  EXPECT_EQ(Hb_Failure, tell(record));
  EXPECT_EQ(5U, out.sequence);
  out.sequence = 0x7B;
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(no_number, hb_get_errno());
  expect_all_up();
  const auto fd = static_cast<uint64_t>(descriptor());
  EXPECT_THAT(traced(), ElementsAre(Pair(254U, info), Pair(256U, info), Pair(255U, info)));
  EXPECT_THAT(numbers_of(255), ElementsAre(fd));
}

// Trace.

TEST_F(SplitMerge, RecordsItsStepsInTheirOrder) {
  remote = {};
  split();
  const auto fd = static_cast<uint64_t>(descriptor());
  EXPECT_THAT(traced(), ElementsAre(Pair(254U, info), Pair(256U, info), Pair(263U, info), Pair(255U, info)));
  EXPECT_THAT(numbers_of(254), ElementsAre(fd));
  EXPECT_THAT(numbers_of(256), ElementsAre(14, 0, 1, 2, 0, sequence, 31, fd));
  EXPECT_THAT(sizes_of(256), ElementsAre(4, 4, 4, 4, 4, 8, 4, 4));
}

TEST_F(SplitMerge, RecordsNodesThatAreUnknownOrNotUp) {
  Monitored_Client::mark(4, Hb_Entity_Undef, Hb_Entity_State_Reason_Down);
  remote = {99, 4};
  split();
  EXPECT_EQ(info, platform_double().traces_of(265).at(0).category);
  EXPECT_EQ(info, platform_double().traces_of(264).at(0).category);
  EXPECT_THAT(numbers_of(264), ElementsAre(4, static_cast<uint64_t>(Hb_Entity_Undef)));
  EXPECT_THAT(numbers_of(265), ElementsAre(99));
}

TEST_F(SplitMerge, OfNodesThatAreUnknownOrNotUpIsToldWithoutTraceAsWell) {
  Monitored_Client::mark(4, Hb_Entity_Down, Hb_Entity_State_Reason_STOPPED_Down);
  Monitored_Client::trace_nothing();
  remote = {99, 4};
  EXPECT_EQ(Hb_Success, split());
  expect_parts({1, 2}, {99, 4});
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_F(SplitMerge, ThatIsToldKeepsTheSystemsErrorNumber) {
  platform_double().errno_after_trace = 5;
  errno = 77;
  EXPECT_EQ(Hb_Success, split());
  EXPECT_EQ(77, errno);
  hb_free_split_info(&info_of());
  EXPECT_EQ(Hb_Success, merge());
  EXPECT_EQ(77, errno);
}

TEST_F(SplitMerge, KeepsTheSystemsErrorNumber) {
  platform_double().errno_after_trace = 5;
  auto record = report(ZU_EVM_SUBCLUSTER_SPLIT);
  record.event_subtype = ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_REMOTE;
  errno = 77;
  tell(record);
  EXPECT_EQ(77, errno);
}

// Memory.

class SplitMergeMemory : public SplitMerge, public testing::WithParamInterface<int> {
 protected:
  Hb_Rc tell_without_memory(zu_evm_event_type_t type) {
    calloc_calls = 0;
    calloc_fails_at = GetParam();
    const Hb_Rc rc = tell(report(type));
    calloc_fails_at = 0;
    has_lists = false;
    return rc;
  }
  // What comes behind the list that there is no memory for is as it was.
  void expect_no_list() {
    const Hb_Split_Merge_Info info = info_of();
    EXPECT_EQ(nullptr, info.local_subcluster.node_numbers);
    EXPECT_EQ(0U, info.local_subcluster.num_up_nodes);
    const bool first = GetParam() == 1;
    EXPECT_EQ(first ? 0x5A5A5A5A5A5A5A5A : 0, reinterpret_cast<uintptr_t>(info.remote_subcluster.node_numbers));
    EXPECT_EQ(first ? 0x5A5A5A5AU : 0U, info.remote_subcluster.num_up_nodes);
    EXPECT_EQ(0x5A5A5A5AU, info.subtype);
  }
};

TEST_P(SplitMergeMemory, WithoutItASplitFailsAndChangesNothing) {
  EXPECT_EQ(Hb_Failure, tell_without_memory(ZU_EVM_SUBCLUSTER_SPLIT));
  EXPECT_EQ(17, hb_get_errno());
  expect_no_list();
  EXPECT_EQ(5U, out.sequence);
  expect_all_up();
  EXPECT_THAT(traced(), ElementsAre(Pair(254U, info), Pair(256U, info), Pair(262U, errors), Pair(255U, info)));
  EXPECT_THAT(sizes_of(262), ElementsAre(4, 100, 4));
  EXPECT_EQ(static_cast<uint32_t>(ENOMEM), platform_double().traces_of(262)[0].block_value(0));
  EXPECT_EQ("lib/VEX_EVMONNodeLivenessHandler", platform_double().traces_of(262)[0].block_text(1));
  EXPECT_NE(0U, platform_double().traces_of(262)[0].block_value(2));
}

TEST_P(SplitMergeMemory, WithoutItAMergeFailsWithNothingInTheGroup) {
  EXPECT_EQ(Hb_Failure, tell_without_memory(ZU_EVM_SUBCLUSTER_MERGE));
  EXPECT_EQ(17, hb_get_errno());
  expect_no_list();
  EXPECT_EQ(1U, times_traced(262));
}

TEST_P(SplitMergeMemory, WithoutItFailsWithoutTraceAsWell) {
  Monitored_Client::trace_nothing();
  EXPECT_EQ(Hb_Failure, tell_without_memory(ZU_EVM_SUBCLUSTER_SPLIT));
  EXPECT_EQ(ENOMEM, errno);
  EXPECT_THAT(traced(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(FirstAndSecondList, SplitMergeMemory, testing::Values(1, 2));

TEST_F(SplitMerge, WithoutMemoryForTheDeathFailsAndMarksNobody) {
  Monitored_Client::trace_nothing();
  {
    const AllocationFailure failure(1);
    EXPECT_EQ(Hb_Failure, split());
    EXPECT_TRUE(failure.happened());
  }
  has_lists = false;
  EXPECT_EQ(17, hb_get_errno());
  EXPECT_EQ(nullptr, info_of().local_subcluster.node_numbers);
  EXPECT_EQ(nullptr, info_of().remote_subcluster.node_numbers);
  expect_all_up();
}

TEST_F(SplitMerge, WithoutMemoryForTheAdaptersOfANodeFailsAndTellsTheOthers) {
  Monitored_Client::trace_nothing();
  {
    const AllocationFailure failure(4);  // behind the nodes and the two arrays of the index
    EXPECT_EQ(Hb_Failure, split());
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(17, hb_get_errno());
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3, 4}, 2}, Queued_Event{1, {adapter(3, 0), adapter(3, 1)}, 2}));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(4, 0));
}

// Records as no platform should make them.

TEST_F(SplitMerge, WithALocalListThatIsMissingOrTooLongIsAsWithoutMemoryForIt) {
  for (const zu_evm_event_type_t type : {ZU_EVM_SUBCLUSTER_SPLIT, ZU_EVM_SUBCLUSTER_MERGE}) {
    auto record = report(type);
    record.local_node_numbers = nullptr;
    expect_no_room(record);
    for (const uint32_t count : {2050U, 0x7FFFFFFFU, minus_one}) {
      record = report(type);
      record.num_local_node_up = count;
      expect_no_room(record);
    }
  }
}

TEST_F(SplitMerge, WithARemoteListThatIsMissingOrTooLongIsAsWithoutMemoryForIt) {
  for (const zu_evm_event_type_t type : {ZU_EVM_SUBCLUSTER_SPLIT, ZU_EVM_SUBCLUSTER_MERGE}) {
    auto record = report(type);
    record.remote_node_numbers = nullptr;
    expect_no_room(record);
    EXPECT_EQ(nullptr, info_of().remote_subcluster.node_numbers);
    for (const uint32_t count : {2050U, 0x7FFFFFFFU, minus_one}) {
      record = report(type);
      record.num_remote_node_up = count;
      expect_no_room(record);
      EXPECT_EQ(nullptr, info_of().remote_subcluster.node_numbers);
    }
  }
}

TEST_F(SplitMerge, OfAsManyNodesAsAClusterCanHaveIsTold) {
  remote.clear();
  for (uint32_t node = 0; node < 2049; ++node) remote.push_back(node);
  EXPECT_EQ(Hb_Success, split());
  expect_parts({1, 2}, remote);
  EXPECT_EQ((Queued_Event{1, {1, 2, 3, 4}, 2049}), Monitored_Client::queue().at(0));
}

TEST_F(SplitMerge, OfNodesBeyondEveryTableKillsNobody) {
  remote = {2049, 65536 + 3, 0x80000003, minus_one};
  EXPECT_EQ(Hb_Success, split());
  expect_parts({1, 2}, remote);
  expect_all_up();
  EXPECT_EQ(4U, times_traced(265));
}

TEST_F(SplitMerge, ARecordThatIsNoneFails) {
  EXPECT_EQ(Hb_Failure, monitor.SplitMergeEventHandler(nullptr, &out.events, out.name, out.group.get(), &out.sequence));
  EXPECT_TRUE(out.untouched());
}

// Through the monitor.

TEST_F(SplitMerge, ReadFromTheMonitorIsGivenBackWithItsLists) {
  EXPECT_EQ(Hb_Success, take(report(ZU_EVM_SUBCLUSTER_SPLIT)));
  has_lists = true;
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::split_merge));
  expect_parts({1, 2}, {4, 3});
}

}  // namespace
}  // namespace hb_test
