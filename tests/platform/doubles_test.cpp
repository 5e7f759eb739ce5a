// The doubles of the platform: tests rely on what they record and answer.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <cstring>
#include <stdexcept>

#include "platform_doubles.h"

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

namespace {

class PlatformDoubles : public testing::Test {
 protected:
  PlatformDoubles() { platform_double().reset(); }

  int register_three() {
    const tr_category categories[] = {{0, "Errors", 0, 0}, {1, "Info", 1, 0}, {2, "Debug", 2, 0}};
    return tr_ms_register_component_1("_HBC", levels, categories, 3, tokens);
  }

  uint8_t levels[3] = {7, 7, 7};
  tr_file_token tokens[3] = {};
  Platform_Double& platform = platform_double();
};

using PlatformDoublesDeathTest = PlatformDoubles;

TEST_F(PlatformDoubles, RegistrationIsRecordedAndFillsLevelsAndTokens) {
  platform.levels = {1, 0, 1};
  EXPECT_EQ(register_three(), 0);
  EXPECT_THAT(levels, ElementsAre(1, 0, 1));
  EXPECT_THAT(tokens, ElementsAre(Platform_Double::token(0), Platform_Double::token(1), Platform_Double::token(2)));
  ASSERT_THAT(platform.registrations, SizeIs(1));
  const Recorded_Registration& registration = platform.registrations[0];
  EXPECT_EQ(registration.component, "_HBC");
  EXPECT_EQ(registration.levels, levels);
  EXPECT_EQ(registration.tokens, tokens);
  ASSERT_THAT(registration.categories, SizeIs(3));
  EXPECT_EQ(registration.categories[2].id, 2U);
  EXPECT_EQ(registration.categories[2].name, "Debug");
  EXPECT_EQ(registration.categories[2].default_level, 2U);
  EXPECT_EQ(registration.categories[2].minimum_level, 0U);
}

TEST_F(PlatformDoubles, LevelsAreOffUnlessSetAndMayChangeLater) {
  EXPECT_EQ(register_three(), 0);
  EXPECT_THAT(levels, ElementsAre(0, 0, 0));
  platform.set_levels({0, 1, 1});
  EXPECT_THAT(levels, ElementsAre(0, 1, 1));
  platform.registrations[0].levels[0] = 1;
  EXPECT_EQ(levels[0], 1);
}

TEST_F(PlatformDoubles, RegistrationYieldsTheResultThatIsScripted) {
  platform.registration_result = -1;
  EXPECT_EQ(register_three(), -1);
}

TEST_F(PlatformDoubles, RecordsOfEveryFormAreKeptInOrder) {
  register_three();
  const int32_t number = -1;
  tr_ms_record_id_1("_HBC", 272, tokens[1]);
  tr_ms_record_values_32_1("_HBC", 273, tokens[0], 2, 5U, 0xFFFFFFFFU);
  tr_ms_record_data_1("_HBC", 36, tokens[0], 3, "text", 5U, &number, 4U, static_cast<const void*>(nullptr), 9U);
  tr_ms_record_strings_1("_HBC", 57, tokens[2], 2, "one", static_cast<const char*>(nullptr));
  EXPECT_THAT(platform.trace_ids(), ElementsAre(272, 273, 36, 57));
  EXPECT_EQ(platform.traces[0].form, Trace_Form::id);
  EXPECT_EQ(platform.traces[0].component, "_HBC");
  EXPECT_EQ(platform.traces[0].category, 1);
  EXPECT_EQ(platform.traces[1].form, Trace_Form::values);
  EXPECT_THAT(platform.traces[1].values, ElementsAre(5U, 0xFFFFFFFFU));
  EXPECT_EQ(platform.traces[2].form, Trace_Form::data);
  ASSERT_THAT(platform.traces[2].blocks, SizeIs(3));
  EXPECT_THAT(platform.traces[2].blocks[0], ElementsAre('t', 'e', 'x', 't', 0));
  EXPECT_EQ(platform.traces[2].block_text(0), "text");
  EXPECT_EQ(platform.traces[2].block_value(1), 0xFFFFFFFFU);
  EXPECT_THAT(platform.traces[2].blocks[2], IsEmpty());
  EXPECT_EQ(platform.traces[3].form, Trace_Form::strings);
  EXPECT_EQ(platform.traces[3].category, 2);
  EXPECT_THAT(platform.traces[3].strings, ElementsAre("one", ""));
  EXPECT_THAT(platform.traces_of(273), SizeIs(1));
  EXPECT_THAT(platform.traces_of(274), IsEmpty());
}

TEST_F(PlatformDoubles, TokenOfNoCategoryIsMarked) {
  tr_ms_record_id_1("_HBC", 1, nullptr);
  EXPECT_EQ(platform.traces.at(0).category, -1);
  EXPECT_EQ(platform.traces.at(0).token, nullptr);
}

TEST_F(PlatformDoubles, BlockThatIsNoNumberIsNotTakenForOne) {
  tr_ms_record_data_1("_HBC", 1, nullptr, 1, "abcde", 5U);
  EXPECT_THROW(platform.traces.at(0).block_value(0), std::length_error);
  EXPECT_THROW(platform.traces.at(0).block_text(1), std::out_of_range);
}

TEST_F(PlatformDoubles, RecordsCanDisturbTheErrorNumber) {
  errno = EXDEV;
  tr_ms_record_id_1("_HBC", 1, nullptr);
  EXPECT_EQ(errno, EXDEV);
  platform.errno_after_trace = EPERM;
  tr_ms_record_id_1("_HBC", 1, nullptr);
  EXPECT_EQ(errno, EPERM);
}

TEST_F(PlatformDoubles, AssertionsAreRecordedAndReturn) {
  __zu_assert("f() == 0", "lib/hb_global_data", 12);
  ASSERT_THAT(platform.assertions, SizeIs(1));
  EXPECT_EQ(platform.assertions[0].text, "f() == 0");
  EXPECT_EQ(platform.assertions[0].file, "lib/hb_global_data");
  EXPECT_EQ(platform.assertions[0].line, 12);
}

TEST_F(PlatformDoublesDeathTest, AssertionsCanBeMadeToAbort) {
  platform.assertion_action = Assertion_Action::abort_process;
  EXPECT_EXIT(__zu_assert("f() == 0", "lib/a", 12), testing::KilledBySignal(SIGABRT),
              "assertion failed: f\\(\\) == 0, file lib/a, line 12");
}

TEST_F(PlatformDoubles, ClusterServicesAreAbsentUnlessScripted) {
  zu_vex_cluster_info_t before{};
  zu_vex_cluster_info_t* output = &before;
  EXPECT_EQ(zu_vex_get_cluster_info(&output), -1);
  EXPECT_EQ(output, &before);
  EXPECT_EQ(platform.cluster_info.calls, 1);
}

TEST_F(PlatformDoubles, QueriesAnswerInTheOrderScripted) {
  char name[] = "en0";
  zu_vex_net_intf_info_t first{};
  first.node_number = 1;
  first.p_name = name;
  zu_vex_net_intf_info_t second{};
  second.node_number = 2;
  zu_vex_net_intf_info_t* list = platform.interface_list({first, second});
  platform.net_intf_info.answers = {{0, list}, {-5, nullptr, EPERM}};
  zu_vex_net_intf_info_t* output = nullptr;
  EXPECT_EQ(zu_vex_get_net_intf_info(&output), 0);
  ASSERT_EQ(output, list);
  EXPECT_EQ(output->node_number, 1U);
  EXPECT_STREQ(output->p_name, "en0");
  EXPECT_NE(output->p_name, name);
  ASSERT_NE(output->p_next, nullptr);
  EXPECT_EQ(output->p_next->node_number, 2U);
  EXPECT_EQ(output->p_next->p_next, nullptr);
  EXPECT_EQ(zu_vex_get_net_intf_info(&output), -5);
  EXPECT_EQ(errno, EPERM);
  EXPECT_EQ(output, list);
  EXPECT_EQ(zu_vex_get_net_intf_info(&output), -1);
  EXPECT_EQ(platform.net_intf_info.calls, 3);
  EXPECT_EQ(platform.interface_list({}), nullptr);
}

TEST_F(PlatformDoubles, BootAddressesHaveAScriptOfTheirOwn) {
  zu_vex_net_intf_info_t record{};
  platform.boot_addrs.answers = {{0, &record}};
  zu_vex_net_intf_info_t* output = nullptr;
  EXPECT_EQ(zu_vex_get_boot_addrs(&output), 0);
  EXPECT_EQ(output, &record);
  EXPECT_EQ(platform.boot_addrs.calls, 1);
  EXPECT_EQ(platform.net_intf_info.calls, 0);
}

TEST_F(PlatformDoubles, KeysAreRefusedUnlessScripted) {
  const uint8_t bytes[] = {1, 2, 3};
  const sec_buffer buffer{3, bytes};
  sec_key_desc key;
  std::memset(&key, 0xA5, sizeof key);
  EXPECT_EQ(sec_unmarshal_typed_key(&buffer, &key), -1);
  EXPECT_EQ(key.value, nullptr);
  EXPECT_EQ(key.length, 0);
  ASSERT_THAT(platform.unmarshals, SizeIs(1));
  EXPECT_EQ(platform.unmarshals[0].length, 3);
  EXPECT_THAT(platform.unmarshals[0].bytes, ElementsAre(1, 2, 3));
  EXPECT_EQ(platform.unmarshals[0].key, &key);
}

TEST_F(PlatformDoubles, KeysAreHandedOutAndReleasedAsScripted) {
  platform.unmarshal_answers = {{0, 9, 2, {4, 5}}};
  const sec_buffer buffer{-1, nullptr};
  sec_key_desc key{};
  EXPECT_EQ(sec_unmarshal_typed_key(&buffer, &key), 0);
  EXPECT_EQ(key.type, 9U);
  EXPECT_EQ(key.version, 2);
  ASSERT_EQ(key.length, 2);
  EXPECT_EQ(static_cast<uint8_t*>(key.value)[1], 5);
  sec_release_typed_key(&key);
  EXPECT_EQ(key.value, nullptr);
  ASSERT_THAT(platform.releases, SizeIs(1));
  EXPECT_EQ(platform.releases[0].key, &key);
  EXPECT_EQ(platform.releases[0].before.type, 9U);
}

TEST_F(PlatformDoubles, ResetForgetsEverything) {
  platform.levels = {1, 1, 1};
  register_three();
  tr_ms_record_id_1("_HBC", 1, tokens[0]);
  __zu_assert("f() == 0", "lib/a", 1);
  platform.boot_addrs.answers = {{0, nullptr}};
  platform.reset();
  EXPECT_THAT(platform.registrations, IsEmpty());
  EXPECT_THAT(platform.traces, IsEmpty());
  EXPECT_THAT(platform.assertions, IsEmpty());
  EXPECT_THAT(platform.levels, IsEmpty());
  zu_vex_net_intf_info_t* output = nullptr;
  EXPECT_EQ(zu_vex_get_boot_addrs(&output), -1);
}

}  // namespace
