// How a request that failed ends the command, where no conversation can make it fail so in a test's time.
#include <gmock/gmock.h>

#include <memory>

#include "hb_client.h"
#include "request.h"
#include "support/fake_daemon.h"

namespace hbctl {
namespace {

using hb_test::configuration_answer;
using hb_test::FakeDaemon;
using hb_test::small_cluster;

TEST(HbctlRequestError, is_a_doubt_when_no_answer_came_in_time) {
  FakeDaemon daemon;
  daemon.serve_configuration(configuration_answer(small_cluster()));
  ASSERT_EQ(hb_init(), Hb_Success);
  const auto group = std::make_unique<Hb_Group>();
  Hb_Events events = 0;
  Hb_Name name{};
  Hb_Seq_Num sequence = 0;
  timeval no_time{0, 0};
  int* descriptors = nullptr;
  int count = 0;
  ASSERT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Success);
  ASSERT_EQ(hb_get_event_message(descriptors, &no_time, &events, name, group.get(), &sequence), Hb_Failure);
  const CommandError error = request_error("configure adapter 1", "unused");
  EXPECT_EQ(error.status(), ExitStatus::Unclear);
  EXPECT_EQ(error.number(), 2);
  EXPECT_THAT(error.what(), testing::StartsWith("cannot configure adapter 1: HB_ENOTREADY (2), "));
  hb_free_file_descriptor_array(descriptors);
  hb_terminate();
}

}  // namespace
}  // namespace hbctl
