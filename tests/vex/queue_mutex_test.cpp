// The mutex of the queue when it cannot be taken or released.
#include "tests_of_the_queue.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

struct Operation {
  const char* description;
  void (*run)();
};

class QueueMutex : public EventQueue, public testing::WithParamInterface<Operation> {
 protected:
  QueueMutex() { queue(Hb_Node_Group, 1); }

  static void expect_assertion(const char* text) {
    ASSERT_EQ(platform_double().assertions.size(), 1U);
    EXPECT_EQ(platform_double().assertions[0].text, text);
    EXPECT_EQ(platform_double().assertions[0].file, "lib/hb_global_data");
    EXPECT_GT(platform_double().assertions[0].line, 0);
  }
};

TEST_P(QueueMutex, ThatCannotBeTakenIsAnAssertion) {
  QueueMutexCalls calls;
  calls.script("pthread_mutex_lock", {result(EINVAL)}).script("pthread_mutex_unlock", {result(0)});
  GetParam().run();
  expect_assertion("pthread_mutex_lock(&event_queue_list_and_sequence_mutex) == 0");
}

TEST_P(QueueMutex, ThatCannotBeReleasedIsAnAssertion) {
  {
    QueueMutexCalls calls;
    calls.script("pthread_mutex_unlock", {result(EPERM)});
    GetParam().run();
  }
  expect_assertion("pthread_mutex_unlock(&event_queue_list_and_sequence_mutex) == 0");
  EXPECT_EQ(pthread_mutex_unlock(&event_queue_list_and_sequence_mutex), 0);
}

TEST_P(QueueMutex, IsTakenAndReleasedOnce) {
  QueueMutexCalls calls;
  GetParam().run();
  EXPECT_THAT(calls.sequence(), ElementsAre("pthread_mutex_lock", "pthread_mutex_unlock"));
  EXPECT_TRUE(platform_double().assertions.empty());
}

INSTANTIATE_TEST_SUITE_P(Operations, QueueMutex,
                         testing::Values(Operation{"Look", [] { VEX_event_queue_is_empty(); }},
                                         Operation{"Append",
                                                   [] { VEX_add_event_at_end(VEX_new_event(Hb_Node_Group)); }},
                                         Operation{"Take", [] { delete VEX_get_event_from_head(); }},
                                         Operation{"Show", [] { VEX_display_event_list(); }},
                                         Operation{"Wake", [] { VEX_write_to_event_pipe(); }},
                                         Operation{"Number", [] { hb_vex_next_event_sequence(); }}),
                         [](const auto& test) { return test.param.description; });

}  // namespace
}  // namespace hb_test
