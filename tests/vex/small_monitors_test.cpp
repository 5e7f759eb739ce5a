// The five monitors whose notifications are traced, and are no event.
#include <functional>

#include "VEX_EVMONNodeListHandler.h"
#include "VEX_EVMONPeerGSLivenessHandler.h"
#include "VEX_EVMONReconfigEventHandler.h"
#include "VEX_EVMONRepositoryDiskHandler.h"
#include "VEX_EVMONSiteConfigEventHandler.h"
#include "monitored_cluster.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::Pair;

constexpr uint64_t sequence = 0x700000009;

char thing[] = "thing";

zu_evm_event_node_list_t node_list() { return {ZU_EVM_EVENT_ADD, 3, {1, 2}, sequence, 41, thing, nullptr}; }
zu_evm_event_process_liveness_t process() { return {ZU_EVM_EVENT_UP, 777, sequence, 41, thing}; }
zu_evm_event_cluster_reconfig_t reconfiguration() { return {ZU_EVM_EVENT_ADD, 3, {1, 2}, sequence, 41}; }
zu_evm_event_repository_disk_t disk() { return {ZU_EVM_EVENT_DOWN, 3, sequence, 41, thing}; }
zu_evm_event_site_cfg_t site() {
  zu_evm_event_site_cfg_t record = {};
  record.event_type = ZU_EVM_SITE_UP;
  record.node_number = 3;
  record.site_number = 2;
  record.sequence_number = sequence;
  record.reason_number = 41;
  record.site_name = thing;
  return record;
}

template <typename Handler>
std::unique_ptr<EVMONHandler> make(char* path) {
  return std::make_unique<Handler>(path);
}

template <auto Record>
void notify(int descriptor) {
  scripted_cluster().notify(descriptor, Record());
}

struct Small_Monitor {
  const char* name;
  std::unique_ptr<EVMONHandler> (*make)(char* path);
  uint32_t begins;  // 0 when the call itself is not traced, as is the next
  uint32_t ends;
  uint32_t failed;
  uint32_t told;
  std::vector<uint64_t> numbers;  // of the record, the name as a number at its end
  std::vector<size_t> sizes;
  void (*notify)(int descriptor);

  friend std::ostream& operator<<(std::ostream& out, const Small_Monitor& monitor) { return out << monitor.name; }
};

// "thing" and its terminator as a number.
constexpr uint64_t thing_number = 0x676E696874;

const Small_Monitor small_monitors[] = {
    {"NodeList",
     make<EVMONNodeListHandler>,
     229,
     230,
     116,
     330,
     {2, 3, sequence, 41, thing_number},
     {4, 4, 8, 4, 6},
     notify<node_list>},
    {"PeerGSLiveness",
     make<EVMONPeerGSLivenessHandler>,
     0,
     0,
     13,
     331,
     {1, 777, sequence, 41, thing_number},
     {4, 4, 8, 4, 6},
     notify<process>},
    {"Reconfiguration",
     make<EVMONReconfigEventHandler>,
     0,
     0,
     52,
     332,
     {2, 3, sequence, 41},
     {4, 4, 8, 4},
     notify<reconfiguration>},
    {"RepositoryDisk",
     make<EVMONRepositoryDiskHandler>,
     0,
     0,
     198,
     333,
     {0, 3, sequence, 41, thing_number},
     {4, 4, 8, 4, 6},
     notify<disk>},
    {"SiteConfiguration",
     make<EVMONSiteConfigEventHandler>,
     219,
     220,
     210,
     334,
     {9, 3, 2, sequence, 41, thing_number},
     {4, 4, 4, 8, 4, 6},
     notify<site>},
};

class SmallMonitors : public testing::TestWithParam<Small_Monitor> {
 protected:
  SmallMonitors() : monitor(GetParam().make(path)) { Monitored_Client::forget_traces(); }
  void SetUp() override { ASSERT_TRUE(client.started); }

  int descriptor() { return monitor->getFileDescriptor(); }
  Hb_Rc take() { return monitor->handler(&out.events, out.name, out.group.get(), &out.sequence); }

  // The records around one, where the call itself is traced.
  std::vector<std::pair<uint32_t, int>> around(uint32_t record) {
    if (GetParam().begins == 0) return {{record, info}};
    return {{GetParam().begins, info}, {record, info}, {GetParam().ends, info}};
  }
  bool only_events_written() {
    out.events = 0x7A;
    return out.untouched();
  }

  Monitored_Client client;
  char path[16] = "monitor";
  std::unique_ptr<EVMONHandler> monitor;
  EventOutputs out;
};

TEST_P(SmallMonitors, ThatCannotBeReadFailAndWriteNothing) {
  platform_double().errno_after_trace = 5;
  scripted_cluster().notify_result(descriptor(), -1, ENXIO);
  EXPECT_EQ(Hb_Failure, take());
  EXPECT_EQ(ENXIO, errno);
  EXPECT_EQ(no_number, hb_get_errno());
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(traced(), ElementsAreArray(around(GetParam().failed)));
  const auto fd = static_cast<uint64_t>(descriptor());
  EXPECT_THAT(numbers_of(GetParam().failed), ElementsAre(minus_one, fd, ENXIO));
  EXPECT_EQ(Trace_Form::data, platform_double().traces_of(GetParam().failed).at(0).form);
  if (GetParam().begins != 0) {
    EXPECT_THAT(numbers_of(GetParam().begins), ElementsAre(fd));
    EXPECT_THAT(numbers_of(GetParam().ends), ElementsAre(fd));
  }
}

TEST_P(SmallMonitors, ThatCannotBeReadFailWithoutTraceAsWell) {
  Monitored_Client::trace_nothing();
  scripted_cluster().notify_result(descriptor(), -5, EIO);
  EXPECT_EQ(Hb_Failure, take());
  EXPECT_EQ(EIO, errno);
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_P(SmallMonitors, OfAPlatformWithoutMonitorsFail) {
  scripted_cluster().has_monitors = false;
  const std::unique_ptr<EVMONHandler> absent = GetParam().make(path);
  Monitored_Client::forget_traces();
  errno = 77;
  EXPECT_EQ(Hb_Failure, absent->handler(&out.events, out.name, out.group.get(), &out.sequence));
  EXPECT_EQ(77, errno);
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(numbers_of(GetParam().failed), ElementsAre(minus_one, minus_one, 77));
}

TEST_P(SmallMonitors, WithARecordThatIsNoneFail) {
  scripted_cluster().notify_result(descriptor(), 0);
  EXPECT_EQ(Hb_Failure, take());
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(0U, numbers_of(GetParam().failed).at(0));
}

TEST_P(SmallMonitors, WithNothingToReadFailButForTheOneOfSites) {
  scripted_cluster().wake(descriptor());
  if (GetParam().name == std::string("SiteConfiguration")) {
    EXPECT_EQ(Hb_Success, take());
    EXPECT_EQ(0, out.events);
    EXPECT_THAT(traced(), ElementsAreArray(around(243)));
    EXPECT_TRUE(only_events_written());
  } else {
    EXPECT_EQ(Hb_Failure, take());
    EXPECT_EQ(static_cast<uint32_t>(-16), numbers_of(GetParam().failed).at(0));
    EXPECT_TRUE(out.untouched());
  }
}

TEST_P(SmallMonitors, TraceANotificationAndTellNoEvent) {
  platform_double().errno_after_trace = 5;
  GetParam().notify(descriptor());
  errno = 77;
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(77, errno);
  EXPECT_EQ(0, out.events);
  EXPECT_TRUE(only_events_written());
  EXPECT_THAT(traced(), ElementsAreArray(around(GetParam().told)));
  EXPECT_EQ(GetParam().numbers, numbers_of(GetParam().told));
  EXPECT_EQ(GetParam().sizes, sizes_of(GetParam().told));
}

TEST_P(SmallMonitors, ConsumeTheNotificationAndGiveItBack) {
  GetParam().notify(descriptor());
  take();
  EXPECT_EQ(0U, scripted_cluster().waiting(descriptor()));
  EXPECT_EQ(0U, Scripted_Cluster::wrong_releases());
  for (const Platform_Handout kind :
       {Platform_Handout::node_list, Platform_Handout::process_liveness, Platform_Handout::cluster_reconfig,
        Platform_Handout::repository_disk, Platform_Handout::site_cfg}) {
    EXPECT_EQ(0U, Scripted_Cluster::outstanding(kind));
  }
}

TEST_P(SmallMonitors, NeverChangeTheQueueOrTheTable) {
  auto* waiting = VEX_new_configuration_event();
  VEX_add_event_at_end(waiting);
  const int32_t number = waiting->sequence_num;
  Monitored_Client::add_node(5);
  GetParam().notify(descriptor());
  take();
  scripted_cluster().notify_result(descriptor(), -1);
  take();
  EXPECT_EQ(waiting, event_queue_list);
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
  EXPECT_EQ(number, waiting->sequence_num);
  EXPECT_EQ(0, client.bytes_in_pipe());
  EXPECT_FALSE(Monitored_Client::is_configured(5));
  EXPECT_EQ(4, global_config_tbl.Hb_num_nodes);
  EXPECT_EQ(0, global_config_tbl_new.Hb_num_nodes);
}

TEST_P(SmallMonitors, AreReachedByTheirDescriptor) {
  GetParam().notify(descriptor());
  int descriptors[] = {descriptor(), -1};
  Hb_Rc rc = Hb_Failure;
  EVMONHandler::dispatch(descriptors, &out.events, out.name, out.group.get(), &out.sequence, &rc);
  EXPECT_EQ(Hb_Success, rc);
  EXPECT_EQ(0, out.events);
}

TEST_P(SmallMonitors, AreArmedWithNothing) {
  const Platform_Question& opened = scripted_cluster().asked.back();
  EXPECT_EQ("zu_evm_open", std::string(opened.call));
  EXPECT_EQ("monitor", std::string(opened.path.c_str()));
  EXPECT_EQ("", std::string(opened.init_string.c_str()));
}

TEST_P(SmallMonitors, ThatCannotBeReadNeedNoOutputs) {
  scripted_cluster().notify_result(descriptor(), -1, ENXIO);
  EXPECT_EQ(Hb_Failure, monitor->handler(nullptr, nullptr, nullptr, nullptr));
}

INSTANTIATE_TEST_SUITE_P(All, SmallMonitors, testing::ValuesIn(small_monitors),
                         [](const auto& parameter) { return std::string(parameter.param.name); });

// Lists and names.

class SmallMonitorInput : public testing::Test {
 protected:
  SmallMonitorInput() { Monitored_Client::forget_traces(); }

  Hb_Rc take(EVMONHandler& monitor) { return monitor.handler(&out.events, out.name, out.group.get(), &out.sequence); }

  Monitored_Client client;
  char path[16] = "monitor";
  EventOutputs out;
};

TEST_F(SmallMonitorInput, EveryRecordOfAListIsTraced) {
  EVMONNodeListHandler monitor(path);
  zu_evm_event_node_list_t second = node_list();
  second.node_number = 4;
  second.node_name = nullptr;
  zu_evm_event_node_list_t first = node_list();
  first.next = &second;
  scripted_cluster().notify(monitor.getFileDescriptor(), first);
  EXPECT_EQ(Hb_Success, take(monitor));
  const std::vector<Recorded_Trace> told = platform_double().traces_of(330);
  ASSERT_EQ(2U, told.size());
  EXPECT_EQ(3U, told[0].block_value(1));
  EXPECT_EQ(4U, told[1].block_value(1));
  EXPECT_EQ("", told[1].block_text(4));
}

TEST_F(SmallMonitorInput, OfAListOneRecordForEachNumberANodeCanHaveIsTraced) {
  EVMONNodeListHandler monitor(path);
  std::vector<zu_evm_event_node_list_t> list(3000, node_list());
  for (size_t index = 0; index + 1 < list.size(); ++index) list[index].next = &list[index + 1];
  scripted_cluster().notify(monitor.getFileDescriptor(), list.front());
  EXPECT_EQ(Hb_Success, take(monitor));
  EXPECT_EQ(2049U, times_traced(330));
  EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::node_list));
}

TEST_F(SmallMonitorInput, OfANameTheFirst255CharactersAreTraced) {
  EVMONRepositoryDiskHandler monitor(path);
  std::string name(4000, 'd');
  zu_evm_event_repository_disk_t record = disk();
  record.disk_name = name.data();
  scripted_cluster().notify(monitor.getFileDescriptor(), record);
  EXPECT_EQ(Hb_Success, take(monitor));
  EXPECT_EQ(std::string(255, 'd'), platform_double().traces_of(333).at(0).block_text(4));
}

TEST_F(SmallMonitorInput, AMissingNameIsAnEmptyOne) {
  EVMONPeerGSLivenessHandler monitor(path);
  zu_evm_event_process_liveness_t record = process();
  record.process_name = nullptr;
  scripted_cluster().notify(monitor.getFileDescriptor(), record);
  EXPECT_EQ(Hb_Success, take(monitor));
  EXPECT_EQ("", platform_double().traces_of(331).at(0).block_text(4));
}

}  // namespace
}  // namespace hb_test
