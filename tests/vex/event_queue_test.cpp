// The queue of synthesized events and its numbering.
#include <thread>
#include <type_traits>

#include "VEX_EVMONEventPipeHandler.h"
#include "tests_of_the_queue.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST_F(EventQueue, IsEmptyAtFirst) {
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_True);
  EXPECT_EQ(event_queue_list, nullptr);
  EXPECT_EQ(event_sequence, 0);
}

TEST_F(EventQueue, YieldsNothingWhenEmptyAndKeepsItsNumbering) {
  event_sequence = 7;
  EXPECT_EQ(VEX_get_event_from_head(), nullptr);
  EXPECT_EQ(event_sequence, 7);
}

TEST_F(EventQueue, NumbersEventsFromZeroAndGivesThemOutInTheirOrder) {
  Hb_VEX_Event* first = queue(Hb_Node_Group, 1);
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_False);
  Hb_VEX_Event* second = queue(Hb_Adapter_Group, 2);
  Hb_VEX_Event* third = queue(Hb_Site_Group, 32);
  EXPECT_EQ(event_sequence, 3);
  int32_t number = 0;
  for (const Hb_VEX_Event* expected : {first, second, third}) {
    const std::unique_ptr<Hb_VEX_Event> event = take();
    EXPECT_EQ(event.get(), expected);
    EXPECT_EQ(event->sequence_num, number++);
  }
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_True);
}

TEST_F(EventQueue, GivesAnEventThatWasPutBackOutFirstAndWithItsNumber) {
  queue(Hb_Node_Group, 1);
  const Hb_VEX_Event* second = queue(Hb_Node_Group, 2);
  Hb_VEX_Event* first = take().release();
  VEX_put_event_back_at_head(first);
  const std::unique_ptr<Hb_VEX_Event> again = take();
  EXPECT_EQ(again.get(), first);
  EXPECT_EQ(again->sequence_num, 0);
  EXPECT_EQ(take().get(), second);
  EXPECT_EQ(event_sequence, 2);
}

TEST_F(EventQueue, GoesOnCountingWhenEventsWereTaken) {
  queue(Hb_Node_Group, 1);
  take();
  EXPECT_EQ(queue(Hb_Node_Group, 1)->sequence_num, 1);
}

TEST_F(EventQueue, OverwritesTheNumberAndTheLinkOfAnAppendedEvent) {
  Hb_VEX_Event* event = VEX_new_event(Hb_Node_Group);
  event->sequence_num = 44;
  event->next = event;
  VEX_add_event_at_end(event);
  EXPECT_EQ(event->sequence_num, 0);
  EXPECT_EQ(event->next, nullptr);
}

TEST_F(EventQueue, LeavesTheLinkOfATakenEventAsItWas) {
  const Hb_VEX_Event* first = queue(Hb_Node_Group, 1);
  const Hb_VEX_Event* second = queue(Hb_Node_Group, 2);
  const std::unique_ptr<Hb_VEX_Event> taken = take();
  EXPECT_EQ(taken.get(), first);
  EXPECT_EQ(taken->next, second);
  EXPECT_EQ(event_queue_list, second);
}

TEST_F(EventQueue, WritesNoByteWhenAnEventIsAppended) {
  Ends ends = new_pipe();
  event_pipe_handler_p = new EVMONEventPipeHandler(ends.fds, nullptr);
  start_tracing();
  queue(Hb_Node_Group, 1);
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(EventQueue, TakesNoEventThatIsNone) {
  VEX_add_event_at_end(nullptr);
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_True);
  EXPECT_EQ(event_sequence, 0);
}

TEST_F(EventQueue, HandsOutTheNumbersOfItsSequence) {
  EXPECT_EQ(hb_vex_next_event_sequence(), 0);
  EXPECT_EQ(hb_vex_next_event_sequence(), 1);
  EXPECT_EQ(queue(Hb_Node_Group, 1)->sequence_num, 2);
  EXPECT_EQ(event_sequence, 3);
}

TEST_F(EventQueue, GoesOnWithTheLowestNumberBehindTheHighest) {
  event_sequence = INT32_MAX;
  EXPECT_EQ(hb_vex_next_event_sequence(), INT32_MAX);
  EXPECT_EQ(hb_vex_next_event_sequence(), INT32_MIN);
}

TEST_F(EventQueue, IsNotDrainedWhenTheHandlersAreDeleted) {
  const Hb_VEX_Event* event = queue(Hb_Node_Group, 1);
  VEX_delete_global_event_handlers();
  EXPECT_EQ(event_queue_list, event);
  EXPECT_EQ(event_sequence, 1);
}

TEST_F(EventQueue, ShowsItsEventsInTheTrace) {
  queue(Hb_Node_Group, 1);
  queue(Hb_Adapter_Group, 2);
  queue(Hb_Site_Group, 64);
  start_tracing();
  VEX_display_event_list();
  EXPECT_THAT(trace_lines(), ElementsAre("Info 71: 0 0 1", "Info 71: 1 1 2", "Info 71: 2 4 64", "Info 57"));
  EXPECT_EQ(platform_double().traces.back().form, Trace_Form::strings);
  EXPECT_THAT(platform_double().traces.back().strings, ElementsAre("End of event list"));
  EXPECT_NE(event_queue_list, nullptr);
}

TEST_F(EventQueue, ShowsOnlyItsEndWhenEmpty) {
  VEX_display_event_list();
  EXPECT_THAT(trace_lines(), ElementsAre("Info 57"));
}

TEST_F(EventQueue, ShowsNothingWithoutInfoTracing) {
  queue(Hb_Node_Group, 1);
  platform_double().set_levels({1, 0, 1});
  VEX_display_event_list();
  EXPECT_THAT(trace_lines(), IsEmpty());
}

// Each operation runs with the mutex held by the thread that calls it, and leaves it held once.
TEST_F(EventQueue, IsUsedByAThreadThatHoldsItsMutexAlready) {
  ASSERT_EQ(pthread_mutex_lock(&event_queue_list_and_sequence_mutex), 0);
  queue(Hb_Node_Group, 1);
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_False);
  EXPECT_EQ(hb_vex_next_event_sequence(), 1);
  VEX_display_event_list();
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Failure);
  EXPECT_NE(take(), nullptr);
  EXPECT_FALSE(is_mutex_free());
  ASSERT_EQ(pthread_mutex_unlock(&event_queue_list_and_sequence_mutex), 0);
  EXPECT_TRUE(is_mutex_free());
}

TEST_F(EventQueue, GivesANewEventItsKindAndNothingElse) {
  const std::unique_ptr<Hb_VEX_Event> event(VEX_new_event(Hb_Site_Group));
  EXPECT_EQ(event->group.Hb_group_type, Hb_Site_Group);
  EXPECT_EQ(event->group.Hb_events, 0);
  EXPECT_EQ(event->next, nullptr);
  EXPECT_EQ(event->type, 0U);
  EXPECT_EQ(event->node_num, 0U);
  EXPECT_EQ(event->site_num, 0U);
}

// What the fixtures of handlers rest on.
TEST(StateOfHandlers, IsForgottenWithEverySubscription) {
  struct Fixture : HandlerState {
    void TestBody() override {}
  };
  Hb_Name* const names[] = {&nodeEventSubscriptionName, &networkEventSubscriptionName, &siteEventSubscriptionName,
                            &splitMergeEventSubscriptionName};
  for (Hb_Name* name : names) set_name(*name, "left by another test");
  const Fixture fixture;
  for (const Hb_Name* name : names) EXPECT_STREQ(*name, "");
}

static_assert(std::is_same_v<decltype(VEX_Event::sequence_num), int32_t>);
static_assert(std::is_same_v<decltype(VEX_Event::group), Hb_Group>);
static_assert(std::is_same_v<decltype(VEX_Event::next), VEX_Event*>);
static_assert(std::is_same_v<decltype(VEX_Event::type), uint32_t>);
static_assert(std::is_same_v<decltype(VEX_Event::node_num), uint16_t>);
static_assert(std::is_same_v<decltype(VEX_Event::site_num), Hb_Site_Number>);
static_assert(std::is_same_v<Hb_Site_Number, uint16_t>);
static_assert(std::is_same_v<Hb_VEX_Event, VEX_Event>);

TEST(EventRecord, HasItsFieldsInTheirOrder) {
  EXPECT_LT(offsetof(VEX_Event, sequence_num), offsetof(VEX_Event, group));
  EXPECT_LT(offsetof(VEX_Event, group), offsetof(VEX_Event, next));
  EXPECT_LT(offsetof(VEX_Event, next), offsetof(VEX_Event, type));
  EXPECT_LT(offsetof(VEX_Event, type), offsetof(VEX_Event, node_num));
  EXPECT_LT(offsetof(VEX_Event, node_num), offsetof(VEX_Event, site_num));
}

}  // namespace
}  // namespace hb_test
