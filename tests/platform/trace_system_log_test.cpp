// Trace to the system log, whose functions are replaced in this program.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <array>
#include <cstdarg>
#include <cstdio>

#include "child_process.h"
#include "trace_component.h"

using testing::ElementsAre;
using testing::IsEmpty;

namespace {

struct Log_Message {
  int priority;
  std::string text;
  bool operator==(const Log_Message&) const = default;
};

std::vector<Log_Message> messages;
int openings_and_closings = 0;

void log_message(int priority, const char* format, va_list arguments) {
  std::array<char, 1024> text;
  std::vsnprintf(text.data(), text.size(), format, arguments);
  messages.push_back({priority, text.data()});
}

}  // namespace

extern "C" {

void syslog(int priority, const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  log_message(priority, format, arguments);
  va_end(arguments);
}

// What a hardened build calls instead.
void __syslog_chk(int priority, int, const char* format, ...);
void __syslog_chk(int priority, int, const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  log_message(priority, format, arguments);
  va_end(arguments);
}

void openlog(const char*, int, int) { ++openings_and_closings; }
void closelog() { ++openings_and_closings; }
}

namespace {

TEST(TraceToTheSystemLog, HasThePriorityOfTheCategory) {
  const Child_Result child = run_in_child([] {
    set_trace("syslog", "debug");
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    tr_ms_record_values_32_1("_HBC", 273, component.tokens[errors], 1, static_cast<uint32_t>(-1));
    tr_ms_record_id_1("_HBC", 272, component.tokens[info]);
    tr_ms_record_values_32_1("_HBC", 313, component.tokens[debug], 1, 4U);
    EXPECT_THAT(
        messages,
        ElementsAre(Log_Message{LOG_USER | LOG_ERR, "_HBC Errors 273 boot addresses are not available: result -1"},
                    Log_Message{LOG_USER | LOG_INFO, "_HBC Info 272 event monitor mode begins"},
                    Log_Message{LOG_USER | LOG_DEBUG, "_HBC Debug 313 group walk: no member after cursor 4"}));
  });
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "");
}

TEST(TraceToTheSystemLog, LeavesTheProgramsIdentityThereAlone) {
  const Child_Result child = run_in_child([] {
    set_trace("syslog", nullptr);
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    tr_ms_record_id_1("_HBC", 272, component.tokens[info]);
    EXPECT_EQ(messages.size(), 1U);
    EXPECT_EQ(openings_and_closings, 0);
  });
  EXPECT_EQ(child.exit_status, 0);
}

TEST(TraceToTheSystemLog, TakesPercentSignsAsTheyStand) {
  const Child_Result child = run_in_child([] {
    set_trace("syslog", nullptr);
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    tr_ms_record_strings_1("_HBC", 57, component.tokens[info], 1, "%s%n");
    EXPECT_THAT(messages, ElementsAre(Log_Message{LOG_USER | LOG_INFO, "_HBC Info 57 event queue: %s%n"}));
  });
  EXPECT_EQ(child.exit_status, 0);
}

TEST(TraceToTheSystemLog, IsSilentWhereTraceIsOff) {
  const Child_Result child = run_in_child([] {
    set_trace(nullptr, nullptr);
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    tr_ms_record_id_1("_HBC", 272, component.tokens[info]);
    EXPECT_THAT(messages, IsEmpty());
  });
  EXPECT_EQ(child.exit_status, 0);
}

}  // namespace
