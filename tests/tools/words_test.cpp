#include "words.h"

#include <gmock/gmock.h>

namespace hbctl {
namespace {

TEST(HbctlWords, name_what_monitoring_says) {
  const char* words[] = {"unknown",
                         "up",
                         "down",
                         "interface-down",
                         "misconfigured",
                         "broadcast-misconfigured",
                         "not-monitored",
                         "no-monitor",
                         "monitor-error",
                         "cannot-bind-socket",
                         "cannot-open-device"};
  for (int number = 1; number <= 11; ++number)
    EXPECT_EQ(monitoring_word(static_cast<Hb_Adapter_state_t>(number)), words[number - 1]);
  EXPECT_EQ(monitoring_word(static_cast<Hb_Adapter_state_t>(0)), "state 0");
  EXPECT_EQ(monitoring_word(static_cast<Hb_Adapter_state_t>(12)), "state 12");
  EXPECT_EQ(monitoring_word(static_cast<Hb_Adapter_state_t>(-1)), "state -1");
}

TEST(HbctlWords, name_each_event) {
  EXPECT_EQ(event_word(0), "empty");
  EXPECT_EQ(event_word(1), "death");
  EXPECT_EQ(event_word(2), "join");
  EXPECT_EQ(event_word(4), "new-group");
  EXPECT_EQ(event_word(8), "failure-data");
  EXPECT_EQ(event_word(32), "site-split");
  EXPECT_EQ(event_word(64), "site-merge");
  EXPECT_EQ(event_word(128), "configuration");
  EXPECT_EQ(event_word(256), "different-instance");
  EXPECT_EQ(event_word(512), "heartbeat");
  EXPECT_EQ(event_word(4096), "subcluster-split");
  EXPECT_EQ(event_word(8192), "subcluster-merge");
  EXPECT_EQ(event_word(16384), "alias");
  EXPECT_EQ(event_word(3), "event");
}

TEST(HbctlWords, stand_for_the_bits_of_a_subscription) {
  EXPECT_EQ(bits_of_word("death"), 1);
  EXPECT_EQ(bits_of_word("join"), 2);
  EXPECT_EQ(bits_of_word("new-group"), 4);
  EXPECT_EQ(bits_of_word("different-instance"), 0x100);
  EXPECT_EQ(bits_of_word("heartbeat"), 0x200);
  EXPECT_EQ(bits_of_word("sites"), 0x60);
  EXPECT_EQ(bits_of_word("split-merge"), 0x3000);
  EXPECT_EQ(bits_of_word("all"), 0x3367);
}

TEST(HbctlWords, that_nobody_can_subscribe_to_stand_for_nothing) {
  for (const char* word : {"configuration", "failure-data", "empty", "alias", "nonsense", ""})
    EXPECT_EQ(bits_of_word(word), 0) << word;
}

TEST(HbctlWords, of_subscriptions_are_listed) {
  EXPECT_THAT(subscribable_words(), testing::UnorderedElementsAre("death", "join", "new-group", "sites",
                                                                  "different-instance", "heartbeat", "split-merge"));
}

TEST(HbctlWords, name_each_reason) {
  const std::vector<std::string> reasons = {"down",        "up",           "brixd-down", "brixd-up",
                                            "local-split", "remote-split", "link-down",  "shut-down",
                                            "forced-down", "stopped",      "undefined"};
  for (size_t i = 0; i < reasons.size(); ++i)
    EXPECT_EQ(reason_word(static_cast<Hb_Entity_State_Reason>(i)), reasons[i]);
  EXPECT_EQ(reason_word(static_cast<Hb_Entity_State_Reason>(11)), "reason 11");
  EXPECT_EQ(reason_word(static_cast<Hb_Entity_State_Reason>(-1)), "reason -1");
}

TEST(HbctlWords, name_each_state) {
  EXPECT_EQ(state_word(State::Up), "up");
  EXPECT_EQ(state_word(State::Down), "down");
  EXPECT_EQ(state_word(State::Unknown), "unknown");
}

}  // namespace
}  // namespace hbctl
