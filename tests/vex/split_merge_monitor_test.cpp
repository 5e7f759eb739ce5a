// The monitor of its own for splits and merges, which succeeds only with nothing to read.
#include "VEX_EVMONSplitMergeEventHandler.h"

#include "monitored_cluster.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

class SplitMergeMonitor : public MonitorTest<EVMONSplitMergeEventHandler> {};

TEST_F(SplitMergeMonitor, ThatCannotBeReadFailsAndWritesNothing) {
  platform_double().errno_after_trace = 5;
  EXPECT_EQ(Hb_Failure, take_result(-1, ENXIO));
  EXPECT_EQ(ENXIO, errno);
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(no_number, hb_get_errno());
  const auto fd = static_cast<uint64_t>(descriptor());
  EXPECT_THAT(traced(), ElementsAre(Pair(254U, info), Pair(258U, errors), Pair(255U, info)));
  EXPECT_THAT(numbers_of(254), ElementsAre(fd));
  EXPECT_THAT(numbers_of(258), ElementsAre(minus_one, fd, ENXIO));
  EXPECT_THAT(numbers_of(255), ElementsAre(fd));
}

TEST_F(SplitMergeMonitor, ThatCannotBeReadFailsWithoutTraceAsWell) {
  Monitored_Client::trace_nothing();
  EXPECT_EQ(Hb_Failure, take_result(-1, ENXIO));
  EXPECT_EQ(ENXIO, errno);
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_F(SplitMergeMonitor, WithNothingToReadIsTheEventNone) {
  platform_double().errno_after_trace = 5;
  scripted_cluster().wake(descriptor());
  errno = 77;
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(77, errno);
  EXPECT_EQ(0, out.events);
  out.events = 0x7A;
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(traced(), ElementsAre(Pair(254U, info), Pair(257U, info), Pair(255U, info)));
}

TEST_F(SplitMergeMonitor, WithARecordFailsAndGivesItBackUnread) {
  Monitored_Client::subscribe();
  uint32_t nodes[] = {3};
  zu_evm_event_split_merge_cfg_t split = {};
  split.event_type = ZU_EVM_SUBCLUSTER_SPLIT;
  split.num_remote_node_up = 1;
  split.remote_node_numbers = nodes;
  EXPECT_EQ(Hb_Failure, take(split));
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::split_merge));
  EXPECT_EQ(0U, numbers_of(258).at(0));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of(3).first);
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
}

TEST_F(SplitMergeMonitor, IsArmedWithNothing) {
  const Platform_Question* opened = nullptr;
  for (const Platform_Question& question : scripted_cluster().asked) {
    if (question.call == std::string("zu_evm_open")) opened = &question;
  }
  ASSERT_NE(nullptr, opened);
  EXPECT_EQ("monitor", std::string(opened->path.c_str()));
  EXPECT_EQ("", std::string(opened->init_string.c_str()));
}

}  // namespace
}  // namespace hb_test
