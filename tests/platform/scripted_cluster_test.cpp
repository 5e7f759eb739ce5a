// The scripted cluster itself: what it answers, and that it counts what is out.
#include "scripted_cluster.h"

#include <gmock/gmock.h>
#include <poll.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>

#include "platform_doubles.h"
#include "support/allocation_faults.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ScriptedCluster : public testing::Test {
 protected:
  ScriptedCluster() {
    platform_double().reset();
    cluster.local_node = 3;
    cluster.nodes = {{3}, {5, ZU_VEX_NODE_STATUS_DOWN, ZU_VEX_NODE_DOWN_REASON_STOPPED, std::nullopt}};
    cluster.interfaces = {{3, "en0", scripted_address(0, 0, 3)}, {5, "en1", scripted_address(0, 0, 5)}};
    cluster.boot_addresses = {cluster.interfaces[0]};
  }
  ~ScriptedCluster() override { platform_double().reset(); }

  int open_monitor(const char* path = "/monitor") {
    int descriptor = -1;
    EXPECT_EQ(0, zu_evm_open(path, "CHANGED=YES\n", &descriptor));
    return descriptor;
  }
  static bool readable(int descriptor) {
    pollfd asked = {descriptor, POLLIN, 0};
    return poll(&asked, 1, 0) == 1 && asked.revents == POLLIN;
  }

  Scripted_Cluster& cluster = scripted_cluster();
};

TEST_F(ScriptedCluster, IsAbsentUntilItAppears) {
  int descriptor = 77;
  zu_vex_node_info_t* nodes = nullptr;
  errno = EXDEV;
  EXPECT_EQ(-1, zu_vex_get_node_info(&nodes));
  EXPECT_EQ(-1, zu_evm_open("/monitor", nullptr, &descriptor));
  EXPECT_EQ(EXDEV, errno);
  EXPECT_EQ(77, descriptor);
  EXPECT_EQ(0U, Scripted_Cluster::handed_out());
}

TEST_F(ScriptedCluster, QueriesHandOutWhatATestHasFilledIn) {
  cluster.appear();
  zu_vex_cluster_info_t* info = nullptr;
  zu_vex_node_info_t* nodes = nullptr;
  zu_vex_net_intf_info_t* interfaces = nullptr;
  zu_vex_net_intf_info_t* boot = nullptr;
  ASSERT_EQ(0, zu_vex_get_cluster_info(&info));
  ASSERT_EQ(0, zu_vex_get_node_info(&nodes));
  ASSERT_EQ(0, zu_vex_get_net_intf_info(&interfaces));
  ASSERT_EQ(0, zu_vex_get_boot_addrs(&boot));
  EXPECT_EQ(3U, info->local_node_number);
  EXPECT_STREQ("scripted", info->p_cluster_name);
  EXPECT_STREQ("node", nodes->p_name);
  EXPECT_EQ(5U, nodes->p_next->number);
  EXPECT_EQ(ZU_VEX_NODE_STATUS_DOWN, nodes->p_next->status);
  EXPECT_EQ(ZU_VEX_NODE_DOWN_REASON_STOPPED, nodes->p_next->node_down_reason);
  EXPECT_EQ(nullptr, nodes->p_next->p_name);
  EXPECT_EQ(nullptr, nodes->p_next->p_next);
  EXPECT_STREQ("en1", interfaces->p_next->p_name);
  EXPECT_EQ(htonl(0x0A000005), interfaces->p_next->ip_addr.zu_vex_v4_in_v6.v4_in_v6_ipv4);
  EXPECT_EQ(nullptr, boot->p_next);
  EXPECT_EQ(6U, Scripted_Cluster::handed_out());
  EXPECT_EQ(3U, Scripted_Cluster::outstanding(Platform_Handout::net_intf_info));
  zu_vex_free_cluster_info(info);
  zu_vex_free_node_info(nodes);
  zu_vex_free_net_intf_info(interfaces);
  EXPECT_EQ(1U, Scripted_Cluster::outstanding());
  zu_vex_free_net_intf_info(boot);
  EXPECT_EQ(0U, Scripted_Cluster::outstanding());
  EXPECT_EQ(0U, Scripted_Cluster::wrong_releases());
}

TEST_F(ScriptedCluster, ReleasesOfWhatIsNotOutAreCounted) {
  cluster.appear();
  zu_vex_cluster_info_t* info = nullptr;
  zu_vex_node_info_t foreign = {};
  ASSERT_EQ(0, zu_vex_get_cluster_info(&info));
  zu_evm_free(info);
  EXPECT_EQ(1U, Scripted_Cluster::wrong_releases()) << "another kind";
  zu_vex_free_node_info(&foreign);
  EXPECT_EQ(2U, Scripted_Cluster::wrong_releases()) << "foreign";
  zu_vex_free_cluster_info(info);
  EXPECT_EQ(2U, Scripted_Cluster::wrong_releases());
  zu_vex_free_cluster_info(info);
  EXPECT_EQ(3U, Scripted_Cluster::wrong_releases()) << "released before";
  zu_vex_free_cluster_info(nullptr);
  EXPECT_EQ(3U, Scripted_Cluster::wrong_releases());
}

TEST_F(ScriptedCluster, ScriptedAnswersComeFirstAndCanBeTheUsualOnes) {
  cluster.appear();
  zu_vex_node_info_t* list = cluster.new_nodes({{9}});
  platform_double().node_info_after_event.answers = {{-5, nullptr, EIO}, {0, nullptr, 0, true}, {0, list}};
  zu_evm_event_node_list_t record = {};
  zu_evm_event_metadata_t event = {};
  event.category = ZU_EVM_EVENT_CATEGORY_NODE_LIST;
  event.event.p_node_list = &record;
  zu_vex_node_info_t* nodes = nullptr;
  int looks = 0;
  cluster.at_query_after_event = [&](const zu_evm_event_metadata_t* given) { looks += given == &event ? 1 : 0; };
  EXPECT_EQ(-5, zu_vex_get_node_info_after_event(&event, &nodes));
  EXPECT_EQ(EIO, errno);
  EXPECT_EQ(nullptr, nodes);
  EXPECT_EQ(0, zu_vex_get_node_info_after_event(&event, &nodes));
  EXPECT_EQ(3U, nodes->number);
  zu_vex_free_node_info(nodes);
  EXPECT_EQ(0, zu_vex_get_node_info_after_event(&event, &nodes));
  EXPECT_EQ(9U, nodes->number);
  zu_vex_free_node_info(nodes);
  EXPECT_EQ(3, looks);
  EXPECT_EQ(0U, Scripted_Cluster::wrong_releases());
  EXPECT_EQ(3U, cluster.times_asked("zu_vex_get_node_info_after_event"));
  EXPECT_TRUE(cluster.asked[0].has_metadata);
  EXPECT_EQ(6, cluster.asked[0].category);
  EXPECT_EQ(&record, cluster.asked[0].event);
}

TEST_F(ScriptedCluster, AMonitorIsReadableWhileNotificationsWait) {
  cluster.appear();
  const int descriptor = open_monitor();
  EXPECT_FALSE(readable(descriptor));
  zu_evm_event_node_liveness_t node = {};
  node.node_number = 5;
  cluster.notify(descriptor, node);
  uint32_t numbers[] = {5, 6};
  zu_evm_event_split_merge_cfg_t split = {};
  split.num_remote_node_up = 2;
  split.remote_node_numbers = numbers;
  cluster.notify(descriptor, split);
  EXPECT_EQ(2U, cluster.waiting(descriptor));
  zu_evm_event_node_or_split_merge_cfg_t read = {};
  EXPECT_TRUE(readable(descriptor));
  ASSERT_EQ(2, zu_evm_read_node_liveness(descriptor, &read));
  EXPECT_EQ(5U, read.p_event_node_liveness->node_number);
  zu_evm_free(read.p_event_node_liveness);
  EXPECT_TRUE(readable(descriptor));
  ASSERT_EQ(1, zu_evm_read_node_liveness(descriptor, &read));
  EXPECT_NE(numbers, read.p_event_split_merge_cfg->remote_node_numbers);
  EXPECT_EQ(6U, read.p_event_split_merge_cfg->remote_node_numbers[1]);
  EXPECT_EQ(nullptr, read.p_event_split_merge_cfg->local_node_numbers);
  zu_evm_free(read.p_event_split_merge_cfg);
  EXPECT_FALSE(readable(descriptor));
  EXPECT_EQ(-16, zu_evm_read_node_liveness(descriptor, &read));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding());
  close(descriptor);
}

TEST_F(ScriptedCluster, ListsAreHandedOutAndReleasedWhole) {
  cluster.appear();
  const int descriptor = open_monitor();
  char name[] = "five";
  zu_evm_event_node_list_t second = {};
  second.node_number = 6;
  zu_evm_event_node_list_t first = {};
  first.node_name = name;
  first.next = &second;
  cluster.notify(descriptor, first);
  zu_evm_event_node_list_t* list = nullptr;
  ASSERT_EQ(0, zu_evm_read_node_list(descriptor, &list));
  EXPECT_STREQ("five", list->node_name);
  EXPECT_EQ(6U, list->next->node_number);
  EXPECT_EQ(2U, Scripted_Cluster::outstanding(Platform_Handout::node_list));
  zu_evm_free(list);
  EXPECT_EQ(0U, Scripted_Cluster::outstanding());
  close(descriptor);
}

TEST_F(ScriptedCluster, ReadsCanBeMadeToFail) {
  cluster.appear();
  const int descriptor = open_monitor();
  zu_evm_event_repository_disk_t before = {};
  zu_evm_event_repository_disk_t* record = &before;
  cluster.notify_result(descriptor, -9, EIO);
  EXPECT_EQ(-9, zu_evm_read_repository_disk(descriptor, &record));
  EXPECT_EQ(EIO, errno);
  EXPECT_EQ(&before, record);
  cluster.notify_result(descriptor, 0);
  EXPECT_EQ(0, zu_evm_read_repository_disk(descriptor, &record));
  EXPECT_EQ(nullptr, record);
  cluster.notify(descriptor, zu_evm_event_cluster_reconfig_t{});
  EXPECT_EQ(-1, zu_evm_read_repository_disk(descriptor, &record)) << "of another kind";
  EXPECT_EQ(EINVAL, errno);
  cluster.stray_read_results = {{-4, EBADF}};
  EXPECT_EQ(-4, zu_evm_read_repository_disk(descriptor + 100, &record));
  EXPECT_EQ(-1, zu_evm_read_repository_disk(descriptor + 100, &record));
  close(descriptor);
}

TEST_F(ScriptedCluster, OpensAreRecordedAndCanBeMadeToFail) {
  cluster.appear();
  cluster.open_results = {platform_as_usual, {-3, EACCES}};
  const int first = open_monitor("/first");
  int refused = -1;
  EXPECT_EQ(-3, zu_evm_open("/second", nullptr, &refused));
  EXPECT_EQ(EACCES, errno);
  EXPECT_EQ(-1, refused);
  EXPECT_EQ("CHANGED=YES\n", cluster.asked[0].init_string);
  EXPECT_EQ("/second", cluster.asked[1].path);
  EXPECT_EQ("/first", cluster.path_of(first));
  EXPECT_THAT(cluster.open_monitors(), ElementsAre(first));
  close(first);
  EXPECT_THAT(cluster.open_monitors(), IsEmpty());
  EXPECT_THROW(cluster.notify(first, zu_evm_event_cluster_reconfig_t{}), std::invalid_argument);
}

TEST_F(ScriptedCluster, AnswersWhenTheProcessHasNoMemory) {
  cluster.appear();
  zu_vex_node_info_t* nodes = nullptr;
  int descriptor = -1;
  const long live = live_allocations();
  {
    const AllocationFailure failure(1, false);
    EXPECT_EQ(0, zu_vex_get_node_info(&nodes));
    EXPECT_EQ(0, zu_evm_open("/a path that is longer than what a text keeps in place", nullptr, &descriptor));
    zu_evm_event_node_or_split_merge_cfg_t read = {};
    EXPECT_EQ(-16, zu_evm_read_node_liveness(descriptor, &read));
    EXPECT_FALSE(failure.happened());
  }
  EXPECT_EQ(live, live_allocations());
  zu_vex_free_node_info(nodes);
  close(descriptor);
}

}  // namespace
}  // namespace hb_test
