// What becomes of records once tracing is on.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <functional>
#include <thread>

#include "child_process.h"
#include "support/temporary_directory.h"
#include "trace_component.h"

using testing::Each;
using testing::ElementsAre;
using testing::MatchesRegex;
using testing::SizeIs;

namespace {

using Lines = std::vector<std::string>;

// The lines that a component with everything traced produces.
Lines lines_of(const std::function<void(Trace_Component&)>& body) {
  const Child_Result child = run_in_child([&] {
    set_trace("stderr", "debug");
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    body(component);
  });
  EXPECT_EQ(child.exit_status, 0);
  return without_times(child.errors);
}

TEST(TraceRecord, WithoutValues) {
  const Lines lines = lines_of([](Trace_Component& hbc) { tr_ms_record_id_1("_HBC", 272, hbc.tokens[info]); });
  EXPECT_THAT(lines, ElementsAre("_HBC Info 272 event monitor mode begins"));
}

TEST(TraceRecord, WithValues) {
  const Lines lines = lines_of([](Trace_Component& hbc) {
    tr_ms_record_values_32_1("_HBC", 273, hbc.tokens[errors], 1, static_cast<uint32_t>(-1));
    tr_ms_record_values_32_1("_HBC", 118, hbc.tokens[info], 2, 97U, 2U);
    tr_ms_record_values_32_1("_HBC", 314, hbc.tokens[debug], 1, 98U);
  });
  EXPECT_THAT(lines,
              ElementsAre("_HBC Errors 273 boot addresses are not available: result -1",
                          "_HBC Info 118 adapter 97 loaded: node 2", "_HBC Debug 314 group walk: cursor is now 98"));
}

TEST(TraceRecord, WithDataBlocks) {
  const Lines lines = lines_of([](Trace_Component& hbc) {
    const char call[] = "zu_vex_get_cluster_info()";
    const char detail[] = "(Default)";
    const int32_t result = -1;
    const int32_t error = 2;
    tr_ms_record_data_1("_HBC", 36, hbc.tokens[errors], 4, call, 26U, detail, 10U, &result, 4U, &error, 4U);
  });
  EXPECT_THAT(lines, ElementsAre("_HBC Errors 36 zu_vex_get_cluster_info() (Default) failed: result -1, errno 2"));
}

TEST(TraceRecord, WithTheDataOfARepeatedAddress) {
  const Lines lines = lines_of([](Trace_Component& hbc) {
    const char address[] = "10.1.2.3";
    const char type[] = "en0";
    const uint32_t adapter = 5;
    const int32_t state = 1;
    tr_ms_record_data_1("_HBC", 119, hbc.tokens[info], 4, address, 9U, type, 4U, &adapter, 4U, &state, 4U);
  });
  EXPECT_THAT(lines,
              ElementsAre("_HBC Info 119 address 10.1.2.3 is already taken: adapter type en0, adapter 5, state 1"));
}

TEST(TraceRecord, WithStrings) {
  const Lines lines = lines_of(
      [](Trace_Component& hbc) { tr_ms_record_strings_1("_HBC", 57, hbc.tokens[info], 1, "End of event list"); });
  EXPECT_THAT(lines, ElementsAre("_HBC Info 57 event queue: End of event list"));
}

TEST(TraceRecord, ThatIsUnknownIsStillWritten) {
  const Lines lines = lines_of([](Trace_Component& hbc) {
    tr_ms_record_id_1("_HBC", 9999, hbc.tokens[info]);
    tr_ms_record_values_32_1("_HBC", 9999, hbc.tokens[info], 2, static_cast<uint32_t>(-1), 16U);
  });
  EXPECT_THAT(lines, ElementsAre("_HBC Info 9999 record is not in the catalogue",
                                 "_HBC Info 9999 record is not in the catalogue: -1 (0xffffffff), 16 (0x10)"));
}

TEST(TraceRecord, WithMoreValuesThanPlaceholdersShowsThemAll) {
  const Lines lines =
      lines_of([](Trace_Component& hbc) { tr_ms_record_values_32_1("_HBC", 276, hbc.tokens[errors], 2, 8U, 9U); });
  EXPECT_THAT(lines, ElementsAre("_HBC Errors 276 start failed; further values: 8, 9"));
}

TEST(TraceRecord, OfAComponentWithoutANameIsStillWritten) {
  const Lines lines = lines_of([](Trace_Component& hbc) { tr_ms_record_id_1(nullptr, 276, hbc.tokens[info]); });
  EXPECT_THAT(lines, ElementsAre("? Info 276 record is not in the catalogue"));
}

TEST(TraceRecord, WithoutATokenIsDropped) {
  const Lines lines = lines_of([](Trace_Component&) {
    tr_ms_record_id_1("_HBC", 276, nullptr);
    tr_ms_record_values_32_1("_HBC", 276, nullptr, 1, 1U);
    tr_ms_record_data_1("_HBC", 276, nullptr, 1, "x", 1U);
    tr_ms_record_strings_1("_HBC", 276, nullptr, 1, "x");
  });
  EXPECT_THAT(lines, SizeIs(0));
}

TEST(TraceRecord, LeavesTheErrorNumberOfTheCallerAlone) {
  const Lines lines = lines_of([](Trace_Component& hbc) {
    errno = EXDEV;
    tr_ms_record_values_32_1("_HBC", 118, hbc.tokens[info], 2, 1U, 2U);
    EXPECT_EQ(errno, EXDEV);
  });
  EXPECT_THAT(lines, SizeIs(1));
}

TEST(TraceRegistration, LeavesTheErrorNumberOfTheCallerAlone) {
  const Child_Result child = run_in_child([] {
    set_trace("file:/", nullptr);
    errno = EXDEV;
    EXPECT_EQ(Trace_Component().register_it(), 0);
    EXPECT_EQ(errno, EXDEV);
  });
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "libzu_tr: cannot write trace to /: Is a directory; trace stays off\n");
}

TEST(TraceRegistration, MayBeRepeatedAndBothTokensWork) {
  const Lines lines = lines_of([](Trace_Component& first) {
    Trace_Component second;
    EXPECT_EQ(second.register_it(), 0);
    EXPECT_EQ(second.levels, first.levels);
    tr_ms_record_id_1("_HBC", 276, first.tokens[errors]);
    tr_ms_record_id_1("_HBC", 276, second.tokens[info]);
  });
  EXPECT_THAT(lines, ElementsAre("_HBC Errors 276 start failed", "_HBC Info 276 start failed"));
}

TEST(TraceRegistration, WithAMissingArgumentIsRefusedAndLevelsStay) {
  const tr_category category = {0, "Errors", 0, 0};
  uint8_t level = 7;
  tr_file_token token = nullptr;
  EXPECT_EQ(tr_ms_register_component_1(nullptr, &level, &category, 1, &token), -1);
  EXPECT_EQ(tr_ms_register_component_1("_HBC", nullptr, &category, 1, &token), -1);
  EXPECT_EQ(tr_ms_register_component_1("_HBC", &level, nullptr, 1, &token), -1);
  EXPECT_EQ(tr_ms_register_component_1("_HBC", &level, &category, 1, nullptr), -1);
  EXPECT_EQ(level, 7);
  EXPECT_EQ(token, nullptr);
}

// A thread that is to be cancelled finishes the record that it is making.
TEST(TraceRecord, IsNotCutShortByCancellation) {
  const Lines lines = lines_of([](Trace_Component& hbc) {
    bool made = false;
    std::pair<Trace_Component*, bool*> shared(&hbc, &made);
    const auto body = [](void* argument) -> void* {
      const auto* given = static_cast<std::pair<Trace_Component*, bool*>*>(argument);
      pthread_cancel(pthread_self());
      tr_ms_record_id_1("_HBC", 276, given->first->tokens[info]);
      *given->second = true;
      pthread_testcancel();
      return nullptr;
    };
    pthread_t thread{};
    ASSERT_EQ(pthread_create(&thread, nullptr, body, &shared), 0);
    void* result = nullptr;
    ASSERT_EQ(pthread_join(thread, &result), 0);
    EXPECT_EQ(result, PTHREAD_CANCELED);
    EXPECT_TRUE(made);
  });
  EXPECT_THAT(lines, ElementsAre("_HBC Info 276 start failed"));
}

TEST(TraceRecord, OfSeveralThreadsStayWholeLines) {
  constexpr int threads = 4;
  constexpr int records = 250;
  const TemporaryDirectory directory;
  const std::string path = directory.path("trace");
  const Child_Result child = run_in_child([&] {
    set_trace(("file:" + path).c_str(), nullptr);
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    std::vector<std::thread> running;
    running.reserve(threads);
    for (int each = 0; each < threads; ++each) {
      running.emplace_back([&component] {
        for (uint32_t at = 0; at < records; ++at) {
          tr_ms_record_values_32_1("_HBC", 118, component.tokens[info], 2, at, at / 48);
        }
      });
    }
    for (std::thread& thread : running) thread.join();
  });
  EXPECT_EQ(child.exit_status, 0);
  const Lines lines = without_times(lines_of_file(path));
  EXPECT_THAT(lines, SizeIs(threads * records));
  EXPECT_THAT(lines, Each(MatchesRegex("_HBC Info 118 adapter [0-9]+ loaded: node [0-5]")));
}

TEST(TraceRegistration, MayHappenInSeveralThreadsAtOnce) {
  const Child_Result child = run_in_child([] {
    set_trace("stderr", "errors");
    std::vector<Trace_Component> components(8);
    std::vector<std::thread> running;
    running.reserve(components.size());
    for (Trace_Component& each : components) {
      running.emplace_back([&each] {
        EXPECT_EQ(each.register_it(), 0);
        tr_ms_record_id_1("_HBC", 276, each.tokens[errors]);
      });
    }
    for (std::thread& thread : running) thread.join();
  });
  EXPECT_EQ(child.exit_status, 0);
  const Lines lines = without_times(child.errors);
  EXPECT_THAT(lines, SizeIs(8));
  EXPECT_THAT(lines, Each("_HBC Errors 276 start failed"));
}

}  // namespace
