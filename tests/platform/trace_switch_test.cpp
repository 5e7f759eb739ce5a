// How tracing is switched on, and where the lines go.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>

#include "child_process.h"
#include "support/temporary_directory.h"
#include "trace_component.h"

using testing::Each;
using testing::ElementsAre;
using testing::Ne;

namespace {

constexpr uint32_t start_failed = 276;
constexpr uint32_t no_values_at_all = 0;

void record_one_of_each(const Trace_Component& component) {
  for (const tr_file_token token : component.tokens) tr_ms_record_id_1("_HBC", start_failed, token);
}

// Registers with the two variables set and makes a record in each category.
Child_Result trace_with(const char* place, const char* detail, const std::array<uint8_t, 3>& expected_levels) {
  return run_in_child([&] {
    set_trace(place, detail);
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    EXPECT_EQ(component.levels, expected_levels);
    EXPECT_THAT(component.tokens, Each(Ne(nullptr)));
    record_one_of_each(component);
  });
}

TEST(TraceSwitch, IsOffWhereNothingIsSet) {
  const Child_Result child = trace_with(nullptr, nullptr, {0, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "");
}

TEST(TraceSwitch, IsOffWhereTheVariableIsEmpty) {
  const Child_Result child = trace_with("", "debug", {0, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "");
}

TEST(TraceSwitch, WithoutADetailErrorsAndInfoGoToStandardError) {
  const Child_Result child = trace_with("stderr", nullptr, {1, 1, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_THAT(without_times(child.errors), ElementsAre("_HBC Errors 276 start failed", "_HBC Info 276 start failed"));
}

TEST(TraceSwitch, DetailErrorsIsErrorsAlone) {
  const Child_Result child = trace_with("stderr", "errors", {1, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_THAT(without_times(child.errors), ElementsAre("_HBC Errors 276 start failed"));
}

TEST(TraceSwitch, DetailDebugIsEverything) {
  const Child_Result child = trace_with("stderr", "debug", {1, 1, 2});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_THAT(without_times(child.errors),
              ElementsAre("_HBC Errors 276 start failed", "_HBC Info 276 start failed", "_HBC Debug 276 start failed"));
}

TEST(TraceSwitch, ListOfCategoriesIsThoseAlone) {
  const Child_Result child = trace_with("stderr", "Errors,Debug", {1, 0, 2});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_THAT(without_times(child.errors), ElementsAre("_HBC Errors 276 start failed", "_HBC Debug 276 start failed"));
}

TEST(TraceSwitch, LinesBeginWithTheTime) {
  const Child_Result child = trace_with("stderr", "errors", {1, 0, 0});
  EXPECT_THAT(child.errors, testing::MatchesRegex(
                                "[0-9]{4}-[0-9]{2}-[0-9]{2}T[0-9]{2}:[0-9]{2}:[0-9]{2}\\.[0-9]{6}[+-][0-9]{2}:[0-9]{2}"
                                " _HBC Errors 276 start failed\n"));
}

TEST(TraceSwitch, WrongPlaceIsToldAndTraceStaysOff) {
  const Child_Result child = trace_with("stdout", nullptr, {0, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors,
            "libzu_tr: ZU_TRACE is \"stdout\", which is none of stderr, syslog, file:PATH; trace stays off\n");
}

TEST(TraceSwitch, WrongDetailIsToldAndTraceStaysOff) {
  const Child_Result child = trace_with("stderr", "much", {0, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors,
            "libzu_tr: ZU_TRACE_DETAIL is \"much\", which is none of errors, info, debug, and no list of category "
            "names separated by commas; trace stays off\n");
}

TEST(TraceSwitch, WrongDetailIsNotToldWhereTraceIsOff) {
  const Child_Result child = trace_with(nullptr, "much", {0, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "");
}

TEST(TraceSwitch, WrongValuesAreToldOnce) {
  const auto register_twice = [] {
    for (int times = 0; times < 2; ++times) EXPECT_EQ(Trace_Component().register_it(), 0);
  };
  const Child_Result place = run_in_child([&] { set_trace("nowhere", nullptr), register_twice(); });
  EXPECT_THAT(without_times(place.errors), testing::SizeIs(1));
  const Child_Result detail = run_in_child([&] { set_trace("stderr", "much"), register_twice(); });
  EXPECT_THAT(without_times(detail.errors), testing::SizeIs(1));
}

TEST(TraceSwitch, DestinationIsReadByTheFirstRegistrationOfTheProcess) {
  const Child_Result child = run_in_child([] {
    set_trace(nullptr, nullptr);
    Trace_Component first;
    EXPECT_EQ(first.register_it(), 0);
    set_trace("stderr", nullptr);
    Trace_Component second;
    EXPECT_EQ(second.register_it(), 0);
    EXPECT_THAT(second.levels, Each(0));
  });
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "");
}

TEST(TraceToAFile, IsAddedToWhatIsThere) {
  const TemporaryDirectory directory;
  const std::string path = directory.write("trace", "what was there\n");
  const Child_Result child = trace_with(("file:" + path).c_str(), "errors", {1, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "");
  EXPECT_THAT(without_times(lines_of_file(path)), ElementsAre("what was there", "_HBC Errors 276 start failed"));
}

TEST(TraceToAFile, StandsThereAsSoonAsTheRecordIsMade) {
  const TemporaryDirectory directory;
  const std::string path = directory.path("trace");
  const Child_Result child = run_in_child([&] {
    set_trace(("file:" + path).c_str(), nullptr);
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    tr_ms_record_id_1("_HBC", start_failed, component.tokens[info]);
    EXPECT_THAT(without_times(lines_of_file(path)), ElementsAre("_HBC Info 276 start failed"));
  });
  EXPECT_EQ(child.exit_status, 0);
}

TEST(TraceToAFile, IsOneFileForTwoComponents) {
  const TemporaryDirectory directory;
  const std::string path = directory.path("trace");
  const Child_Result child = run_in_child([&] {
    set_trace(("file:" + path).c_str(), nullptr);
    Trace_Component first;
    Trace_Component second;
    second.name = "_XYZ";
    EXPECT_EQ(first.register_it(), 0);
    EXPECT_EQ(second.register_it(), 0);
    tr_ms_record_id_1("_XYZ", no_values_at_all, second.tokens[info]);
    tr_ms_record_id_1("_HBC", start_failed, first.tokens[info]);
  });
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_THAT(without_times(lines_of_file(path)),
              ElementsAre("_XYZ Info 0 record is not in the catalogue", "_HBC Info 276 start failed"));
}

TEST(TraceToAFile, IsNotInheritedByProgramsThatAreStarted) {
  const TemporaryDirectory directory;
  const std::string path = directory.path("trace");
  const Child_Result child = run_in_child([&] {
    set_trace(("file:" + path).c_str(), nullptr);
    EXPECT_EQ(Trace_Component().register_it(), 0);
    int descriptors_of_the_file = 0;
    for (const auto& each : std::filesystem::directory_iterator("/proc/self/fd")) {
      std::error_code gone;
      if (std::filesystem::read_symlink(each.path(), gone) != path) continue;
      ++descriptors_of_the_file;
      EXPECT_EQ(fcntl(std::stoi(each.path().filename()), F_GETFD), FD_CLOEXEC);
    }
    EXPECT_EQ(descriptors_of_the_file, 1);
  });
  EXPECT_EQ(child.exit_status, 0);
}

TEST(TraceToAFile, ThatCannotBeWrittenIsToldAndTraceStaysOff) {
  const TemporaryDirectory directory;
  const std::string path = directory.write("plain", "") + "/trace";
  const Child_Result child = trace_with(("file:" + path).c_str(), nullptr, {0, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "libzu_tr: cannot write trace to " + path + ": Not a directory; trace stays off\n");
}

TEST(TraceToAFile, InAMissingDirectoryDoesNotCreateIt) {
  const TemporaryDirectory directory;
  const std::string path = directory.path("missing/trace");
  const Child_Result child = trace_with(("file:" + path).c_str(), nullptr, {0, 0, 0});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "libzu_tr: cannot write trace to " + path + ": No such file or directory; trace stays off\n");
  EXPECT_FALSE(std::filesystem::exists(directory.path("missing")));
}

TEST(TraceToAFile, ThatIsFullIsToldOnceAndTheProgramGoesOn) {
  const Child_Result child = trace_with("file:/dev/full", "debug", {1, 1, 2});
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors,
            "libzu_tr: Failed flush to file /dev/full: No space left on device; trace is incomplete from here on\n");
}

}  // namespace
