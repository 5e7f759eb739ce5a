// Opening monitors, and the registry that maps descriptors to handlers.
#include <fcntl.h>

#include <climits>
#include <utility>

#include "handler_state.h"
#include "support/allocation_faults.h"
#include "support/process_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

char monitor_path[] = "/monitor";

class Pipe_Handler : public EVMONHandler {
 public:
  explicit Pipe_Handler(int descriptor, char* label = nullptr) : EVMONHandler(&descriptor, label) {
    evmon_fd = descriptor;
    selfRegister();
  }
  const char* path() const { return evmon_fname; }
  int fd() const { return evmon_fd; }
  void forget_descriptor() { evmon_fd = -1; }
  void set_descriptor(int descriptor) { evmon_fd = descriptor; }
};

// A handler of the descriptor constructor alone.
class Bare_Handler : public EVMONHandler {
 public:
  explicit Bare_Handler(char* label) : EVMONHandler(fds_of_others, label) {}
  const char* path() const { return evmon_fname; }

 private:
  static int32_t fds_of_others[2];
};
int32_t Bare_Handler::fds_of_others[2] = {0, 1};

class Monitor_Handler : public EVMONHandler {
 public:
  explicit Monitor_Handler(char* path, const char* init_string = nullptr) : EVMONHandler(path, init_string) {}
  const char* path() const { return evmon_fname; }
};

int new_descriptor() { return open("/dev/null", O_RDONLY | O_CLOEXEC); }

std::vector<int> listed() {
  const std::unique_ptr<int[]> descriptors(EVMONHandler::getFileDescriptors());
  std::vector<int> list;
  for (const int* descriptor = descriptors.get(); *descriptor != -1; ++descriptor) {
    list.push_back(*descriptor);
  }
  return list;
}

class Registry : public HandlerState {
 protected:
  Registry() { start_anew(); }
  ~Registry() override { start_anew(); }

  static void start_anew() {
    delete[] EVMONHandler::handlerInstances;
    EVMONHandler::handlerInstances = nullptr;
    EVMONHandler::handlerListSlots = 0;
    EVMONHandler::currentSlots = 0;
    EVMONHandler::numbersOfFileDescriptors = 0;
  }

  static std::vector<std::unique_ptr<Pipe_Handler>> register_many(int count) {
    std::vector<std::unique_ptr<Pipe_Handler>> handlers;
    for (int i = 0; i < count; ++i) {
      handlers.push_back(std::make_unique<Pipe_Handler>(new_descriptor()));
    }
    return handlers;
  }
};

TEST_F(Registry, HasNothingBeforeAHandlerRegisters) {
  EXPECT_THAT(listed(), IsEmpty());
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
  EXPECT_EQ(EVMONHandler::handlerInstances, nullptr);
}

TEST_F(Registry, MakesTenSlotsForTheFirstHandler) {
  const Pipe_Handler handler(new_descriptor());
  EXPECT_EQ(EVMONHandler::handlerListSlots, 10);
  EXPECT_EQ(EVMONHandler::currentSlots, 1);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 1);
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, &handler);
  for (int slot = 1; slot < 10; ++slot) {
    EXPECT_EQ(EVMONHandler::handlerInstances[slot].fd, -1);
    EXPECT_EQ(EVMONHandler::handlerInstances[slot].handler, nullptr);
  }
}

TEST_F(Registry, GrowsByTenWhenTheSlotsAreUsedUp) {
  auto handlers = register_many(10);
  EXPECT_EQ(EVMONHandler::handlerListSlots, 10);
  handlers.push_back(std::make_unique<Pipe_Handler>(new_descriptor()));
  EXPECT_EQ(EVMONHandler::handlerListSlots, 20);
  EXPECT_EQ(EVMONHandler::currentSlots, 11);
  for (int slot = 0; slot < 11; ++slot) {
    EXPECT_EQ(EVMONHandler::handlerInstances[slot].handler, handlers[static_cast<size_t>(slot)].get());
  }
  for (int slot = 11; slot < 20; ++slot) {
    EXPECT_EQ(EVMONHandler::handlerInstances[slot].fd, -1);
    EXPECT_EQ(EVMONHandler::handlerInstances[slot].handler, nullptr);
  }
}

TEST_F(Registry, NeverUsesASlotAgain) {
  auto handlers = register_many(11);
  handlers.clear();
  EXPECT_THAT(listed(), IsEmpty());
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
  EXPECT_EQ(EVMONHandler::currentSlots, 11);
  const Pipe_Handler twelfth(new_descriptor());
  EXPECT_EQ(EVMONHandler::handlerInstances[11].handler, &twelfth);
  EXPECT_EQ(EVMONHandler::handlerListSlots, 20);
  EXPECT_EQ(EVMONHandler::currentSlots, 12);
}

TEST_F(Registry, GrowsWithTheRegistrationsHoweverFewAreLive) {
  for (int i = 0; i < 25; ++i) {
    const Pipe_Handler handler(new_descriptor());
    EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 1);
  }
  EXPECT_EQ(EVMONHandler::handlerListSlots, 30);
  EXPECT_EQ(EVMONHandler::currentSlots, 25);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
}

TEST_F(Registry, ListsDescriptorsInTheOrderOfTheirRegistration) {
  auto handlers = register_many(4);
  std::vector<int> expected;
  for (const auto& handler : handlers) {
    expected.push_back(handler->getFileDescriptor());
  }
  EXPECT_EQ(listed(), expected);
  handlers.erase(handlers.begin() + 1);
  expected.erase(expected.begin() + 1);
  EXPECT_EQ(listed(), expected);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 3);
}

TEST_F(Registry, ListsNoMoreThanItCounts) {
  const auto handlers = register_many(3);
  EVMONHandler::numbersOfFileDescriptors = 2;
  EXPECT_EQ(listed().size(), 2U);
  EVMONHandler::numbersOfFileDescriptors = 0;
  EXPECT_THAT(listed(), IsEmpty());
  EVMONHandler::numbersOfFileDescriptors = 3;
}

TEST_F(Registry, RefusesAHandlerWithoutADescriptor) {
  start_tracing();
  const Pipe_Handler handler(-1);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 48: -1"));
  EXPECT_EQ(EVMONHandler::handlerInstances, nullptr);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
}

TEST_F(Registry, NamesTheHandlerThatItRefuses) {
  char label[] = "a pipe";
  const Pipe_Handler handler(-1, label);
  ASSERT_THAT(trace_lines(), ElementsAre("Errors 47"));
  EXPECT_EQ(platform_double().traces[0].block_text(0), "a pipe");
  EXPECT_EQ(platform_double().traces[0].block_value(1), 0xFFFFFFFFU);
}

TEST_F(Registry, RefusesSilentlyWithoutErrorsTracing) {
  set_levels(0);
  const Pipe_Handler handler(-1);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(Registry, ForgetsAHandlerThatIsDestroyedAndClosesItsDescriptor) {
  const int before = open_descriptors();
  {
    const Pipe_Handler handler(new_descriptor());
    EXPECT_EQ(open_descriptors(), before + 1);
  }
  EXPECT_EQ(open_descriptors(), before);
  EXPECT_EQ(EVMONHandler::handlerInstances[0].fd, -1);
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, nullptr);
}

TEST_F(Registry, TellsWhenMoreLeaveThanItCounts) {
  Pipe_Handler handler(new_descriptor());
  EVMONHandler::numbersOfFileDescriptors = 0;
  start_tracing();
  handler.selfUnregister();
  EXPECT_EQ(hb_get_errno(), 82);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 169: 82 0"));
  EXPECT_EQ(EVMONHandler::numbersOfFileDescriptors, 0);
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, nullptr);
}

TEST_F(Registry, LeavesACountBelowZeroAsItIs) {
  Pipe_Handler handler(new_descriptor());
  EVMONHandler::numbersOfFileDescriptors = -3;
  start_tracing();
  handler.selfUnregister();
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 169: 82 -3"));
  EXPECT_EQ(EVMONHandler::numbersOfFileDescriptors, -3);
}

TEST_F(Registry, DoesNothingWhenAHandlerLeavesTwice) {
  Pipe_Handler handler(new_descriptor());
  handler.selfUnregister();
  start_tracing();
  set_hb_errno(0);
  handler.selfUnregister();
  EXPECT_EQ(hb_get_errno(), 0);
  EXPECT_THAT(trace_lines(), IsEmpty());
  EXPECT_EQ(EVMONHandler::numbersOfFileDescriptors, 0);
}

// Without an array it starts as at first, whatever was counted.
TEST_F(Registry, StartsAnewWithoutAnArrayOfSlots) {
  EVMONHandler::handlerListSlots = 30;
  EVMONHandler::currentSlots = 25;
  EVMONHandler::numbersOfFileDescriptors = 7;
  const Pipe_Handler handler(new_descriptor());
  EXPECT_EQ(EVMONHandler::handlerListSlots, 10);
  EXPECT_EQ(EVMONHandler::currentSlots, 1);
  EXPECT_EQ(EVMONHandler::numbersOfFileDescriptors, 1);
  ASSERT_NE(EVMONHandler::handlerInstances, nullptr);
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, &handler);
}

TEST_F(Registry, IsEmptyWithoutAnArrayOfSlots) {
  Pipe_Handler handler(new_descriptor());
  const std::unique_ptr<HandlerInstancesMap[]> slots(std::exchange(EVMONHandler::handlerInstances, nullptr));
  EXPECT_THAT(listed(), IsEmpty());
  handler.selfUnregister();
  EXPECT_EQ(EVMONHandler::numbersOfFileDescriptors, 1);
  EXPECT_EQ(slots[0].handler, &handler);
}

// A descriptor that was closed behind the library's back may be handed out a second time.

TEST_F(Registry, EmptiesTheFirstSlotOfTheDescriptorWhosesoeverItIs) {
  const int descriptor = new_descriptor();
  Pipe_Handler first(descriptor);
  Pipe_Handler second(descriptor);
  second.selfUnregister();
  EXPECT_EQ(EVMONHandler::handlerInstances[0].fd, -1);
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, nullptr);
  EXPECT_EQ(EVMONHandler::handlerInstances[1].fd, descriptor);
  EXPECT_EQ(EVMONHandler::handlerInstances[1].handler, &second);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 1);
  first.selfUnregister();
  EXPECT_EQ(EVMONHandler::handlerInstances[1].handler, nullptr);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
}

TEST_F(Registry, KeepsTheSecondHandlerOfADescriptorWhenTheFirstIsGone) {
  const int descriptor = new_descriptor();
  auto first = std::make_unique<Pipe_Handler>(descriptor);
  const Pipe_Handler second(descriptor);
  first = nullptr;
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, nullptr);
  EXPECT_EQ(EVMONHandler::handlerInstances[1].handler, &second);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 1);
}

TEST_F(Registry, KeepsNothingOfAHandlerThatRegisteredTwice) {
  const int descriptor = new_descriptor();
  auto handler = std::make_unique<Pipe_Handler>(descriptor);
  handler->selfRegister();
  EXPECT_THAT(listed(), ElementsAre(descriptor, descriptor));
  handler = nullptr;
  for (const int slot : {0, 1}) {
    EXPECT_EQ(EVMONHandler::handlerInstances[slot].fd, -1);
    EXPECT_EQ(EVMONHandler::handlerInstances[slot].handler, nullptr);
  }
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
  EXPECT_THAT(listed(), IsEmpty());
}

TEST_F(Registry, KeepsTheOtherHandlerOnceWhenOneThatRegisteredTwiceIsGone) {
  const int descriptor = new_descriptor();
  const Pipe_Handler other(descriptor);
  auto handler = std::make_unique<Pipe_Handler>(descriptor);
  handler->selfRegister();
  handler = nullptr;
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, nullptr);
  EXPECT_EQ(EVMONHandler::handlerInstances[1].handler, &other);
  EXPECT_EQ(EVMONHandler::handlerInstances[2].handler, nullptr);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 1);
}

// It leaves its own slot, with the descriptor, to the handler that loses one by it.
TEST_F(Registry, KeepsNothingOfAHandlerWhoseDescriptorChanged) {
  const Pipe_Handler other(new_descriptor());
  auto handler = std::make_unique<Pipe_Handler>(new_descriptor());
  auto lost = std::make_unique<Pipe_Handler>(new_descriptor());
  close(handler->getFileDescriptor());
  handler->set_descriptor(other.fd());
  lost->forget_descriptor();
  handler = nullptr;
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, nullptr);
  EXPECT_EQ(EVMONHandler::handlerInstances[1].fd, other.fd());
  EXPECT_EQ(EVMONHandler::handlerInstances[1].handler, &other);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 2);
  lost = nullptr;
  EXPECT_EQ(EVMONHandler::handlerInstances[2].fd, -1);
  EXPECT_EQ(EVMONHandler::handlerInstances[2].handler, nullptr);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 1);
}

TEST_F(Registry, KeepsNoHandlerThatIsGoneWhenTwoHaveOneDescriptor) {
  const int descriptor = new_descriptor();
  auto first = std::make_unique<Pipe_Handler>(descriptor);
  auto second = std::make_unique<Pipe_Handler>(descriptor);
  EXPECT_THAT(listed(), ElementsAre(descriptor, descriptor));
  second = nullptr;
  EXPECT_EQ(EVMONHandler::handlerInstances[0].handler, nullptr);
  EXPECT_EQ(EVMONHandler::handlerInstances[1].handler, first.get());
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 1);
}

TEST_F(Registry, DropsAHandlerThatMemoryHasNoPlaceFor) {
  set_levels(0);
  const int before = open_descriptors();
  const int descriptor = new_descriptor();
  {
    const AllocationFailure failure(1);
    Pipe_Handler handler(descriptor);
    EXPECT_TRUE(failure.happened());
    EXPECT_EQ(handler.getFileDescriptor(), -1);
  }
  EXPECT_EQ(hb_get_errno(), 17);
  EXPECT_EQ(EVMONHandler::handlerListSlots, 0);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
  EXPECT_EQ(open_descriptors(), before);
}

TEST_F(Registry, KeepsThoseThatAreThereWhenItCannotGrow) {
  set_levels(0);
  const auto handlers = register_many(10);
  const int descriptor = new_descriptor();
  {
    const AllocationFailure failure(1);
    const Pipe_Handler eleventh(descriptor);
  }
  EXPECT_EQ(EVMONHandler::handlerListSlots, 10);
  EXPECT_EQ(listed().size(), 10U);
}

TEST_F(Registry, ListsNothingWithoutMemory) {
  const auto handlers = register_many(1);
  const AllocationFailure failure(1);
  EXPECT_EQ(EVMONHandler::getFileDescriptors(), nullptr);
}

TEST_F(Registry, ServesTheListOfTheClient) {
  IsVEX = Hb_True;
  client_initialized = Hb_True;
  const auto handlers = register_many(3);
  int* descriptors = nullptr;
  int count = 0;
  EXPECT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Success);
  EXPECT_EQ(count, 3);
  EXPECT_EQ(descriptors[2], handlers[2]->getFileDescriptor());
  EXPECT_EQ(descriptors[3], -1);
  EXPECT_EQ(hb_free_file_descriptor_array(descriptors), Hb_Success);
}

TEST_F(Registry, NeverServesABaseHandler) {
  Pipe_Handler handler(new_descriptor());
  Handler_Outputs out;
  EXPECT_EQ(out.call(handler), Hb_Failure);
  EXPECT_TRUE(out.is_untouched());
}

TEST_F(Registry, LeavesRegistrationToTheHandlersOfPipes) {
  char label[] = "label";
  start_tracing();
  Bare_Handler handler(label);
  EXPECT_EQ(handler.getFileDescriptor(), -1);
  EXPECT_STREQ(handler.path(), "label");
  EXPECT_NE(handler.path(), label);
  EXPECT_THAT(trace_lines(), IsEmpty());
  EXPECT_EQ(EVMONHandler::currentSlots, 0);
  EXPECT_EQ(Bare_Handler(nullptr).path(), nullptr);
}

class Monitor : public Registry {};

TEST_F(Monitor, IsOpenedArmedAndRegistered) {
  scripted_cluster().appear();
  start_tracing();
  errno = EAGAIN;
  Monitor_Handler handler(monitor_path, "CHANGED=YES\n");
  const int descriptor = handler.getFileDescriptor();
  EXPECT_TRUE(scripted_cluster().is_open_monitor(descriptor));
  ASSERT_EQ(scripted_cluster().asked.size(), 1U);
  EXPECT_STREQ(scripted_cluster().asked[0].call, "zu_evm_open");
  EXPECT_STREQ(scripted_cluster().asked[0].path.c_str(), "/monitor");
  EXPECT_STREQ(scripted_cluster().asked[0].init_string.c_str(), "CHANGED=YES\n");
  EXPECT_EQ(handler.getVEXEVMOpenRCInConstructor(), 0);
  EXPECT_EQ(handler.getOpenFileError(), EAGAIN);
  EXPECT_STREQ(handler.path(), "/monitor");
  EXPECT_NE(handler.path(), monitor_path);
  ASSERT_THAT(trace_lines(), ElementsAre("Info 90"));
  EXPECT_EQ(platform_double().traces[0].block_text(0), "/monitor");
  EXPECT_EQ(platform_double().traces[0].block_value(1), static_cast<uint32_t>(descriptor));
  EXPECT_THAT(listed(), ElementsAre(descriptor));
}

TEST_F(Monitor, IsClosedWithItsHandler) {
  scripted_cluster().appear();
  int descriptor = -1;
  {
    Monitor_Handler handler(monitor_path);
    descriptor = handler.getFileDescriptor();
  }
  EXPECT_FALSE(scripted_cluster().is_open_monitor(descriptor));
  EXPECT_THAT(listed(), IsEmpty());
}

TEST_F(Monitor, IsNotOpenedWhereThereAreNone) {
  start_tracing();
  errno = ENOTTY;
  Monitor_Handler handler(monitor_path);
  EXPECT_EQ(handler.getFileDescriptor(), -1);
  EXPECT_EQ(handler.getVEXEVMOpenRCInConstructor(), -1);
  EXPECT_EQ(handler.getOpenFileError(), ENOTTY);
  EXPECT_EQ(handler.path(), nullptr);
  ASSERT_THAT(trace_lines(), ElementsAre("Errors 8"));
  const Recorded_Trace& record = platform_double().traces[0];
  ASSERT_EQ(record.blocks.size(), 3U);
  EXPECT_EQ(record.block_text(0), "/monitor");
  EXPECT_EQ(record.block_value(1), 0xFFFFFFFFU);
  EXPECT_EQ(record.block_value(2), static_cast<uint32_t>(ENOTTY));
  EXPECT_EQ(EVMONHandler::currentSlots, 0);
}

TEST_F(Monitor, SaysWhyItCouldNotBeOpened) {
  scripted_cluster().appear();
  scripted_cluster().open_results = {{-7, EACCES}};
  platform_double().errno_after_trace = EXDEV;
  start_tracing();
  Monitor_Handler handler(monitor_path);
  EXPECT_EQ(errno, EACCES);
  EXPECT_EQ(handler.getFileDescriptor(), -1);
  EXPECT_EQ(handler.getVEXEVMOpenRCInConstructor(), -7);
  EXPECT_EQ(handler.getOpenFileError(), EACCES);
  ASSERT_THAT(trace_lines(), ElementsAre("Errors 8"));
  EXPECT_EQ(platform_double().traces[0].block_value(1), 0xFFFFFFF9U);
  EXPECT_EQ(platform_double().traces[0].block_value(2), static_cast<uint32_t>(EACCES));
}

TEST_F(Monitor, FailsSilentlyWithoutErrorsTracing) {
  set_levels(0);
  Monitor_Handler handler(monitor_path);
  EXPECT_EQ(handler.getVEXEVMOpenRCInConstructor(), -1);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(Monitor, IsNotOpenWithoutADescriptorWhateverTheResult) {
  scripted_cluster().appear();
  scripted_cluster().open_results = {{0, 0}};
  start_tracing();
  Monitor_Handler handler(monitor_path);
  EXPECT_EQ(handler.getFileDescriptor(), -1);
  EXPECT_EQ(handler.getVEXEVMOpenRCInConstructor(), 0);
  EXPECT_EQ(handler.path(), nullptr);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 8"));
  EXPECT_EQ(EVMONHandler::currentSlots, 0);
}

TEST_F(Monitor, NeedsAPath) {
  scripted_cluster().appear();
  start_tracing();
  Monitor_Handler handler(nullptr);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 7"));
  ASSERT_EQ(platform_double().assertions.size(), 1U);
  EXPECT_EQ(platform_double().assertions[0].text, "NULL != fname");
  EXPECT_EQ(platform_double().assertions[0].file, "lib/VEX_EVMONHandler");
  EXPECT_EQ(handler.getVEXEVMOpenRCInConstructor(), -1);
  EXPECT_EQ(handler.getOpenFileError(), 0);
  EXPECT_EQ(handler.getFileDescriptor(), -1);
  EXPECT_THAT(scripted_cluster().asked, IsEmpty());
}

TEST_F(Monitor, IsNotOpenedWithoutMemoryForItsPath) {
  set_levels(0);
  scripted_cluster().appear();
  {
    const AllocationFailure failure(1);
    Monitor_Handler handler(monitor_path);
    EXPECT_EQ(handler.getVEXEVMOpenRCInConstructor(), ENOMEM);
    EXPECT_EQ(handler.getOpenFileError(), ENOMEM);
    EXPECT_EQ(handler.getFileDescriptor(), -1);
  }
  EXPECT_THAT(scripted_cluster().asked, IsEmpty());
}

TEST_F(Monitor, IsClosedWhenMemoryHasNoPlaceForItsHandler) {
  set_levels(0);
  scripted_cluster().appear();
  {
    const AllocationFailure failure(2);
    Monitor_Handler handler(monitor_path);
    EXPECT_EQ(handler.getVEXEVMOpenRCInConstructor(), 0);
    EXPECT_EQ(handler.getFileDescriptor(), -1);
  }
  EXPECT_THAT(scripted_cluster().open_monitors(), IsEmpty());
}

}  // namespace
}  // namespace hb_test
