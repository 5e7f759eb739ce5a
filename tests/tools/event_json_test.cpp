#include "event_json.h"

#include <gmock/gmock.h>

#include "sample_cluster.h"

namespace hbctl {
namespace {

TEST(HbctlEventJson, begins_with_version_and_type) {
  const WatchState state(sample_cluster());
  EXPECT_THAT(json_line(event_json(Event{}, state)),
              testing::StartsWith("{\"version\":1,\"type\":\"event\",\"time\":\"1970-01-01T00:00:00.000Z\","));
}

TEST(HbctlEventJson, has_null_for_what_is_not_known_of_an_adapter) {
  Event event;
  event.bits = 1;
  event.subject = Subject::Adapters;
  event.adapters = {{99, 4, false}};
  const Json json = event_json(event, WatchState(sample_cluster()));
  EXPECT_EQ(json["adapters"][0], Json({{"number", 99},
                                       {"node", nullptr},
                                       {"network", nullptr},
                                       {"address", nullptr},
                                       {"incarnation", 4},
                                       {"removed", false}}));
}

TEST(HbctlEventJson, is_one_line) {
  Event event;
  event.subscription = "two\nlines";
  const std::string line = json_line(event_json(event, WatchState(sample_cluster())));
  EXPECT_EQ(line.find('\n'), line.size() - 1);
}

TEST(HbctlErrorJson, splits_what_failed_from_the_advice) {
  EXPECT_EQ(error_json({ExitStatus::NotReachable, "failed\ndo this\nor that", 15}),
            Json({{"exit_status", 3},
                  {"name", "HB_ECONNECT"},
                  {"number", 15},
                  {"message", "failed"},
                  {"advice", "do this\nor that"}}));
}

TEST(HbctlErrorJson, has_null_for_what_there_is_not) {
  EXPECT_EQ(
      error_json({ExitStatus::Failed, "failed"}),
      Json({{"exit_status", 1}, {"name", nullptr}, {"number", nullptr}, {"message", "failed"}, {"advice", nullptr}}));
}

}  // namespace
}  // namespace hbctl
