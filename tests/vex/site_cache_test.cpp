// What the monitor of sites keeps of this node and its site.
#include "VEX_EVMONSiteConfigEventHandler.h"
#include "monitored_cluster.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

class SiteCache : public MonitorTest<EVMONSiteConfigEventHandler> {
 protected:
  static zu_evm_event_site_cfg_t record_of(uint32_t node, zu_evm_event_type_t type = ZU_EVM_SITE_ADD) {
    zu_evm_event_site_cfg_t record = {};
    record.event_type = type;
    record.node_number = node;
    record.node_id = {0xA1, node};
    record.site_number = 2;
    record.site_id = {0xB1, 0xB2};
    record.site_priority = 6;
    record.site_policy = 8;
    return record;
  }
  std::vector<bool> obtained() const {
    return {monitor.cached_local_node_uuid_obtained, monitor.cached_local_site_info_obtained,
            monitor.cached_site_merge_policy_obtained};
  }
};

TEST_F(SiteCache, IsEmptyAtFirst) { EXPECT_THAT(obtained(), ElementsAre(false, false, false)); }

TEST_F(SiteCache, StaysEmptyWhenNothingCanBeRead) {
  take_result(-1, EIO);
  scripted_cluster().wake(descriptor());
  take();
  EXPECT_THAT(obtained(), ElementsAre(false, false, false));
}

TEST_F(SiteCache, IsFilledByARecordOfThisNode) {
  EXPECT_EQ(Hb_Success, take(record_of(local_node)));
  EXPECT_THAT(obtained(), ElementsAre(true, true, true));
  EXPECT_EQ(0xA1U, monitor.cached_local_node_uuid.high);
  EXPECT_EQ(local_node, monitor.cached_local_node_uuid.low);
  EXPECT_EQ(0xB1U, monitor.cached_local_site_info.id.high);
  EXPECT_EQ(0xB2U, monitor.cached_local_site_info.id.low);
  EXPECT_EQ(2U, monitor.cached_local_site_info.number);
  EXPECT_EQ(6U, monitor.cached_local_site_info.priority);
  EXPECT_EQ(8U, monitor.cached_site_merge_policy);
}

TEST_F(SiteCache, IsNotFilledByRecordsOfOthers) {
  EXPECT_EQ(Hb_Success, take(record_of(2)));
  EXPECT_EQ(Hb_Success, take(record_of(65536 + local_node)));
  EXPECT_THAT(obtained(), ElementsAre(false, false, false));
}

TEST_F(SiteCache, IsFilledByTheRecordOfThisNodeWhereverInAList) {
  zu_evm_event_site_cfg_t last = record_of(local_node);
  zu_evm_event_site_cfg_t first = record_of(2);
  first.next = &last;
  EXPECT_EQ(Hb_Success, take(first));
  EXPECT_THAT(obtained(), ElementsAre(true, true, true));
  EXPECT_EQ(2U, times_traced(334));
}

TEST_F(SiteCache, FollowsAChange) {
  take(record_of(local_node));
  zu_evm_event_site_cfg_t change = record_of(local_node, ZU_EVM_SITE_MODIFY);
  change.site_priority = 9;
  change.site_policy = 1;
  take(change);
  EXPECT_EQ(9U, monitor.cached_local_site_info.priority);
  EXPECT_EQ(1U, monitor.cached_site_merge_policy);
}

TEST_F(SiteCache, KeepsTheNodeWhenItsSiteIsDeleted) {
  take(record_of(local_node));
  take(record_of(local_node, ZU_EVM_SITE_DELETE));
  EXPECT_THAT(obtained(), ElementsAre(true, false, false));
}

TEST_F(SiteCache, KeepsTheSiteWhenAnotherIsDeleted) {
  take(record_of(local_node));
  take(record_of(2, ZU_EVM_SITE_DELETE));
  EXPECT_THAT(obtained(), ElementsAre(true, true, true));
}

}  // namespace
}  // namespace hb_test
