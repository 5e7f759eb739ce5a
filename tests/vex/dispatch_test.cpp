// From a ready descriptor to its handler.
#include <fcntl.h>

#include <utility>

#include "handler_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class Counting_Handler : public EVMONHandler {
 public:
  explicit Counting_Handler(Hb_Rc rc = Hb_Success) : EVMONHandler(&unused, nullptr), rc_(rc) {
    evmon_fd = open("/dev/null", O_RDONLY | O_CLOEXEC);
    selfRegister();
  }

  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum) override {
    ++calls;
    arguments = {events, name, group, seqnum};
    return rc_;
  }

  int calls = 0;
  std::vector<const void*> arguments;

 private:
  static int32_t unused;
  Hb_Rc rc_;
};
int32_t Counting_Handler::unused = -1;

class Dispatch : public HandlerState {
 protected:
  Hb_Rc dispatch(std::vector<int> list) {
    list.push_back(-1);
    start_tracing();
    Hb_Rc rc = static_cast<Hb_Rc>(77);
    EVMONHandler::dispatch(list.data(), &out.events, out.name, out.group.get(), &out.seqnum, &rc);
    return rc;
  }

  Counting_Handler first;
  Counting_Handler second;
  Handler_Outputs out;
};

TEST_F(Dispatch, ServesTheHandlerOfTheDescriptor) {
  EXPECT_EQ(dispatch({second.getFileDescriptor()}), Hb_Success);
  EXPECT_EQ(first.calls, 0);
  EXPECT_EQ(second.calls, 1);
  EXPECT_THAT(second.arguments, ElementsAre(&out.events, out.name, out.group.get(), &out.seqnum));
  EXPECT_THAT(trace_lines(), ElementsAre("Info 252", "Info 253"));
}

TEST_F(Dispatch, PassesDescriptorsOverThatHaveNoHandler) {
  EXPECT_EQ(dispatch({9999, first.getFileDescriptor()}), Hb_Success);
  EXPECT_EQ(first.calls, 1);
}

TEST_F(Dispatch, ServesOnlyTheFirstOfTheListThatHasAHandler) {
  EXPECT_EQ(dispatch({second.getFileDescriptor(), first.getFileDescriptor()}), Hb_Success);
  EXPECT_EQ(second.calls, 1);
  EXPECT_EQ(first.calls, 0);
}

TEST_F(Dispatch, LooksNotBehindTheEndOfTheList) {
  EXPECT_EQ(dispatch({9999, -1, first.getFileDescriptor()}), Hb_Failure);
  EXPECT_EQ(first.calls, 0);
}

TEST_F(Dispatch, YieldsTheResultOfTheHandler) {
  Counting_Handler failing(Hb_Failure);
  set_hb_errno(3);
  EXPECT_EQ(dispatch({failing.getFileDescriptor()}), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 3);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 252", "Info 253"));
}

TEST_F(Dispatch, FailsWhenNoDescriptorHasAHandler) {
  EXPECT_EQ(dispatch({9998, 9999}), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 81);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 252", "Errors 170: 9998", "Info 253"));
  EXPECT_TRUE(out.is_untouched());
}

TEST_F(Dispatch, FailsForAnEmptyList) {
  EXPECT_EQ(dispatch({}), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 81);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 252", "Errors 170: -1", "Info 253"));
}

TEST_F(Dispatch, WritesNothingWithoutAList) {
  start_tracing();
  Hb_Rc rc = static_cast<Hb_Rc>(77);
  EVMONHandler::dispatch(nullptr, &out.events, out.name, out.group.get(), &out.seqnum, &rc);
  EXPECT_EQ(rc, 77);
  EXPECT_EQ(hb_get_errno(), 0);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 252", "Info 253"));
}

TEST_F(Dispatch, IsSilentWithoutTracing) {
  platform_double().set_levels({0, 0, 0});
  EXPECT_EQ(dispatch({9999}), Hb_Failure);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

// Whether the end of the dispatch was traced when its handler ran.
class Looking_Handler : public Counting_Handler {
 public:
  Hb_Rc handler(Hb_Events* /*events*/, char* /*name*/, Hb_Group* /*group*/, Hb_Seq_Num* /*seqnum*/) override {
    traced = trace_lines();
    return Hb_Success;
  }

  std::vector<std::string> traced;
};

TEST_F(Dispatch, EndsInTheTraceWhenTheHandlerHasRun) {
  Looking_Handler handler;
  EXPECT_EQ(dispatch({handler.getFileDescriptor()}), Hb_Success);
  EXPECT_THAT(handler.traced, ElementsAre("Info 252"));
  EXPECT_THAT(trace_lines(), ElementsAre("Info 252", "Info 253"));
}

TEST_F(Dispatch, FindsNoHandlerWithoutAnArrayOfSlots) {
  HandlerInstancesMap* slots = std::exchange(EVMONHandler::handlerInstances, nullptr);
  ASSERT_GT(EVMONHandler::handlerListSlots, 0);
  EXPECT_EQ(dispatch({first.getFileDescriptor()}), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 81);
  EVMONHandler::handlerInstances = slots;
}

TEST_F(Dispatch, FindsNoHandlerThatHasLeft) {
  int descriptor = -1;
  {
    Counting_Handler gone;
    descriptor = gone.getFileDescriptor();
  }
  EXPECT_EQ(dispatch({descriptor}), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 81);
}

}  // namespace
}  // namespace hb_test
