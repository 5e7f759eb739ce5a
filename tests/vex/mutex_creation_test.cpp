// The mutexes are made by whichever function comes first.
#include <functional>

#include "handler_state.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

struct First_Function {
  const char* name;
  std::function<void()> call;
};

class MutexCreation : public HandlerState, public testing::WithParamInterface<First_Function> {};

TEST_P(MutexCreation, IsTheFirstThingThatIsDone) {
  client_initialized = Hb_True;
  SystemCalls calls;
  hbapi_global_data_once = PTHREAD_ONCE_INIT;
  GetParam().call();
  ASSERT_EQ(calls.of("pthread_mutex_init").size(), 2U);
  const std::vector<std::string>& sequence = calls.sequence();
  EXPECT_EQ(sequence[0], "pthread_mutex_init");
  EXPECT_EQ(sequence[1], "pthread_mutex_init");
  EXPECT_EQ(calls.of("pthread_mutex_init")[0].arguments[0], reinterpret_cast<intptr_t>(&global_boot_ip_list_mutex));
  EXPECT_EQ(calls.of("pthread_mutex_init")[1].arguments[0],
            reinterpret_cast<intptr_t>(&event_queue_list_and_sequence_mutex));
  GetParam().call();
  EXPECT_EQ(calls.of("pthread_mutex_init").size(), 2U);
}

INSTANTIATE_TEST_SUITE_P(
    By, MutexCreation,
    testing::Values(
        First_Function{"Look", [] { VEX_event_queue_is_empty(); }},
        First_Function{"Append", [] { VEX_add_event_at_end(VEX_new_event(Hb_Node_Group)); }},
        First_Function{"AppendOfNothing", [] { VEX_add_event_at_end(nullptr); }},
        First_Function{"Take", [] { EXPECT_EQ(VEX_get_event_from_head(), nullptr); }},
        First_Function{"Display", [] { VEX_display_event_list(); }},
        First_Function{"WakeUp", [] { VEX_write_to_event_pipe(); }},
        First_Function{"Number", [] { hb_vex_next_event_sequence(); }},
        First_Function{"Creation", [] { EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success); }},
        First_Function{"InternalCreation", [] { EXPECT_EQ(VEX_create_global_event_handlers_internal(), Hb_Success); }},
        First_Function{"Initialization", [] { EXPECT_EQ(hb_initialize_evmon_event_handlers(), Hb_Success); }},
        First_Function{"Deletion", [] { VEX_delete_global_event_handlers(); }},
        First_Function{"PartialDeletion", [] { VEX_delete_global_event_handlers_except_brix_monitor(); }},
        First_Function{"ExportedDeletion", [] { hb_delete_evmon_event_handlers(); }},
        First_Function{"ExportedPartialDeletion", [] { hb_delete_evmon_event_handlers_except_brix_monitor(); }}),
    [](const auto& test) { return test.param.name; });

}  // namespace
}  // namespace hb_test
