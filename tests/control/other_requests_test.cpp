// Requests that are about no adapter: simulated death, stale messages, heartbeats, control of interface monitors.
#include <gtest/gtest.h>

#include <string>

#include "steering.h"

namespace hb_test {
namespace {

class OtherRequests : public Steering {};

TEST_F(OtherRequests, ASimulatedDeathCarriesItsSeconds) {
  EXPECT_TRUE(succeeds([] { return hb_simulate_death(0x01020304); }));
  EXPECT_TRUE(sent(request_with(217, octets({4, 3, 2, 1}))));
  EXPECT_TRUE(succeeds([] { return hb_simulate_death(0); }));
  EXPECT_TRUE(sent(request_with(217, octets({0, 0, 0, 0}))));
  EXPECT_TRUE(succeeds([] { return hb_simulate_death(-2); }));
  EXPECT_TRUE(sent(request_with(217, octets({0xFE, 0xFF, 0xFF, 0xFF}))));
}

TEST_F(OtherRequests, StaleMessagesAreDiscardedForTrueAlone) {
  EXPECT_TRUE(succeeds([] { return hb_discard_stale_messages(Hb_True); }));
  EXPECT_TRUE(sent(request_without_data(219)));
}

TEST_F(OtherRequests, StaleMessagesAreKeptForAnyOtherValue) {
  for (const int flag : {0, 2, -1, 256, 0x7FFFFFFF}) {
    EXPECT_TRUE(succeeds([flag] { return hb_discard_stale_messages(static_cast<Hb_Boolean>(flag)); })) << flag;
    EXPECT_TRUE(sent(request_without_data(220))) << flag;
  }
}

TEST_F(OtherRequests, AHeartbeatCarriesItsNumber) {
  EXPECT_TRUE(succeeds([] { return hb_client_heartbeat(0x01020304); }));
  EXPECT_TRUE(sent(request_with(222, octets({4, 3, 2, 1}))));
  EXPECT_TRUE(succeeds([] { return hb_client_heartbeat(0xFFFFFFFFU); }));
  EXPECT_TRUE(sent(request_with(222, octets({0xFF, 0xFF, 0xFF, 0xFF}))));
}

// Control of interface monitors.

constexpr auto manual = HB_NIM_MANCTRL_ENABLE;
constexpr auto automatic = HB_NIM_MANCTRL_DISABLED;

class MonitorControl : public Steering {
 protected:
  static Hb_Rc control(Hb_nim_manctrl ctrl, std::string interface) {
    return hb_nim_manual_start_control(ctrl, interface.data());
  }
};

TEST_F(MonitorControl, HasTheNumbersOfTheInterface) {
  EXPECT_EQ(1, HB_NIM_MANCTRL_ENABLE);
  EXPECT_EQ(2, HB_NIM_MANCTRL_DISABLED);
}

TEST_F(MonitorControl, CarriesTheNameWithoutItsTerminator) {
  EXPECT_TRUE(succeeds([] { return control(manual, "en0"); }));
  EXPECT_TRUE(sent(request_with(225, "en0")));
  EXPECT_TRUE(succeeds([] { return control(automatic, "en0"); }));
  EXPECT_TRUE(sent(request_with(226, "en0")));
}

TEST_F(MonitorControl, CarriesAnyCharacters) {
  EXPECT_TRUE(succeeds([] { return control(manual, "\xFF \x01\n"); }));
  EXPECT_TRUE(sent(request_with(225, octets({0xFF, 0x20, 0x01, 0x0A}))));
  EXPECT_TRUE(succeeds([] { return control(automatic, "e"); }));
  EXPECT_TRUE(sent(request_with(226, "e")));
}

TEST_F(MonitorControl, OfAnEmptyNameHasNoData) {
  EXPECT_TRUE(succeeds([] { return control(manual, ""); }));
  EXPECT_TRUE(sent(request_without_data(225)));
  EXPECT_TRUE(succeeds([] { return control(automatic, ""); }));
  EXPECT_TRUE(sent(request_without_data(226)));
}

TEST_F(MonitorControl, OfAnotherValueIsInvalidWhateverTheName) {
  for (const int value : {0, 3, -1, 225, 257, 0x7FFFFFFF}) {
    for (const char* name : {"en0", ""}) {
      const auto ctrl = static_cast<Hb_nim_manctrl>(value);
      EXPECT_TRUE(fails_with(4, [&] { return control(ctrl, name); })) << value;
    }
  }
  EXPECT_TRUE(nothing_sent());
}

TEST_F(MonitorControl, WithoutANameIsInvalid) {
  for (const Hb_nim_manctrl ctrl : {manual, automatic, static_cast<Hb_nim_manctrl>(3)}) {
    EXPECT_TRUE(fails_with(4, [ctrl] { return hb_nim_manual_start_control(ctrl, nullptr); }));
  }
  EXPECT_TRUE(nothing_sent());
}

TEST_F(MonitorControl, CarriesANameAsLongAsARequestsData) {
  const Bytes name(16460, 'e');
  const Bytes expected = request_with(226, name);
  Bytes received;
  daemon.run([&](FakeDaemon&) { received = connection.receive_raw(expected.size()); });
  EXPECT_TRUE(succeeds([&] { return control(automatic, name); }));
  daemon.join();
  EXPECT_TRUE(received == expected);
}

TEST_F(MonitorControl, OfALongerNameIsInvalid) {
  EXPECT_TRUE(fails_with(4, [] { return control(manual, Bytes(16461, 'e')); }));
  EXPECT_TRUE(fails_with(4, [] { return control(automatic, Bytes(100000, 'e')); }));
  EXPECT_TRUE(nothing_sent());
}

}  // namespace
}  // namespace hb_test
