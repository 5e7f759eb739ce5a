// Taking events in VEX mode.
#include <gmock/gmock.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <functional>
#include <memory>

#include "VEX_EVMONEventPipeHandler.h"
#include "event_outputs.h"
#include "hb_global_data/vex_event_queue.h"
#include "platform_doubles.h"
#include "support/system_calls.h"
#include "test_cluster.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

// An event pipe handler that records what it is asked for.
class Scripted_Pipe_Handler : public EVMONEventPipeHandler {
 public:
  explicit Scripted_Pipe_Handler(int32_t* ends) : EVMONEventPipeHandler(ends, nullptr) {}

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override {
    ++calls;
    on_call();
    *events = 64;
    std::memcpy(name, "from the queue", 15);
    group->Hb_group_type = Hb_Site_Group;
    *seqnum_p = 3;
    return result;
  }

  int calls = 0;
  Hb_Rc result = Hb_Success;
  std::function<void()> on_call = [] {};
};

class VexReception : public testing::Test {
 protected:
  VexReception() { IsVEX = Hb_True; }
  ~VexReception() override {
    event_queue_list = nullptr;
    event_pipe_handler_p = nullptr;
    IsVEX = Hb_False;
    trace_nothing();
  }

  void make_handler() {
    int32_t ends[2];
    ASSERT_EQ(0, pipe(ends));
    handler = std::make_unique<Scripted_Pipe_Handler>(ends);
    event_pipe_handler_p = handler.get();
    platform_double().traces.clear();
  }

  Hb_Rc take(int descriptor) {
    int descriptors[] = {descriptor, -1};
    return hb_get_event_message(descriptors, nullptr, &out.events, out.name, out.group.get(), &out.sequence);
  }

  std::unique_ptr<Scripted_Pipe_Handler> handler;
  VEX_Event event = {};
  EventOutputs out;
};

TEST_F(VexReception, WithoutAnEventPipeHandlerNothingCanBeTaken) {
  trace_only(trace_info);
  EXPECT_TRUE(fails_with(90, [&] { return take(0); }));
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(250, 245, 251));
  EXPECT_EQ(1, platform_double().traces[1].category);
  EXPECT_TRUE(out.untouched());
}

TEST_F(VexReception, TheEventPipeHandlerIsMissedBeforeTheDescriptorsAreLookedAt) {
  EXPECT_TRUE(fails_with(90, [&] { return take(-1); }));
}

TEST_F(VexReception, AnEmptyDescriptorArrayFailsWithoutAnErrorNumber) {
  trace_only(trace_info);
  make_handler();
  event_queue_list = &event;
  EXPECT_TRUE(fails_without_error_number([&] { return take(-1); }));
  EXPECT_EQ(0, handler->calls);
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(250));
  EXPECT_TRUE(out.untouched());
}

TEST_F(VexReception, WithAnEmptyQueueADescriptorWithoutAHandlerIsADispatchError) {
  trace_all();
  make_handler();
  EXPECT_TRUE(fails_with(81, [&] { return take(999); }));
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(250, 252, 170, 253, 251));
  const Recorded_Trace& unserved = platform_double().traces[2];
  EXPECT_EQ(0, unserved.category);
  EXPECT_THAT(unserved.values, ElementsAre(999));
  EXPECT_EQ(0, handler->calls);
  EXPECT_TRUE(out.untouched());
}

TEST_F(VexReception, AQueuedEventIsDeliveredByTheEventPipeHandler) {
  trace_only(trace_info);
  make_handler();
  event_queue_list = &event;
  EXPECT_TRUE(succeeds([&] { return take(999); }));
  EXPECT_EQ(1, handler->calls);
  EXPECT_EQ(64, out.events);
  EXPECT_STREQ("from the queue", out.name);
  EXPECT_EQ(Hb_Site_Group, out.group->Hb_group_type);
  EXPECT_EQ(3U, out.sequence);
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(250, 154, 251));
}

TEST_F(VexReception, TheHandlersFailureIsHandedOn) {
  make_handler();
  event_queue_list = &event;
  handler->result = Hb_Failure;
  EXPECT_TRUE(fails_without_error_number([&] { return take(999); }));
  EXPECT_EQ(1, handler->calls);
}

TEST_F(VexReception, TheTimeLimitIsNotWaitedFor) {
  make_handler();
  event_queue_list = &event;
  SystemCalls calls;
  int descriptors[] = {999, -1};
  timeval at_once = {0, 0};
  EXPECT_TRUE(succeeds([&] {
    return hb_get_event_message(descriptors, &at_once, &out.events, out.name, out.group.get(), &out.sequence);
  }));
  EXPECT_EQ(64, out.events);
  EXPECT_THAT(calls.of("select"), IsEmpty());
}

TEST_F(VexReception, TheSystemErrorIsKeptWhateverTracingDoesToIt) {
  trace_all();
  platform_double().errno_after_trace = EPERM;
  errno = EXDEV;
  take(0);
  EXPECT_EQ(EXDEV, errno) << "without a handler";
  make_handler();
  errno = EXDEV;
  take(999);
  EXPECT_EQ(EXDEV, errno) << "with an empty queue";
  event_queue_list = &event;
  take(999);
  EXPECT_EQ(EXDEV, errno) << "with an event in the queue";
  platform_double().errno_after_trace = 0;
}

TEST_F(VexReception, TheQueueIsLookedAtUnderItsMutexWhichIsFreeWhenTheEventIsDelivered) {
  make_handler();
  event_queue_list = &event;
  SystemCalls calls;
  calls.only("pthread_mutex_lock", 0, &event_queue_list_and_sequence_mutex);
  calls.only("pthread_mutex_unlock", 0, &event_queue_list_and_sequence_mutex);
  handler->on_call = [&] {
    EXPECT_EQ(1U, calls.of("pthread_mutex_lock").size());
    EXPECT_EQ(1U, calls.of("pthread_mutex_unlock").size());
  };
  EXPECT_TRUE(succeeds([&] { return take(999); }));
  EXPECT_EQ(1, handler->calls);
  EXPECT_EQ(1U, calls.of("pthread_mutex_lock").size());
}

TEST_F(VexReception, NothingIsTracedWithTheCategoriesOff) {
  trace_only(trace_debug);
  take(0);
  make_handler();
  take(999);
  event_queue_list = &event;
  take(999);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(VexReception, NullPointersAreRefused) {
  make_handler();
  event_queue_list = &event;
  EXPECT_TRUE(fails_with(4, [&] {
    return hb_get_event_message(nullptr, nullptr, &out.events, out.name, out.group.get(), &out.sequence);
  }));
  int descriptors[] = {999, -1};
  EXPECT_TRUE(fails_with(
      4, [&] { return hb_get_event_message(descriptors, nullptr, &out.events, out.name, nullptr, &out.sequence); }));
  EXPECT_EQ(0, handler->calls);
}

}  // namespace
}  // namespace hb_test
