#include "trace_settings.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>

using testing::ElementsAre;

namespace {

const std::array<tr_category, 3> categories = {{{0, "Errors", 0, 0}, {1, "Info", 1, 0}, {2, "Debug", 2, 0}}};

std::vector<bool> detail(const char* value) { return parse_trace_detail(value, categories); }

void expect_place_refused(const char* value, const std::string& text) {
  try {
    parse_trace_place(value);
    FAIL() << "\"" << value << "\" was accepted";
  } catch (const Trace_Setting_Error& error) {
    EXPECT_EQ(error.what(), text);
  }
}

void expect_detail_refused(const char* value, const std::string& text) {
  try {
    detail(value);
    FAIL() << "\"" << value << "\" was accepted";
  } catch (const Trace_Setting_Error& error) {
    EXPECT_EQ(error.what(), text);
  }
}

TEST(TracePlace, NothingSetIsNoTrace) {
  EXPECT_EQ(parse_trace_place(nullptr).destination, Trace_Destination::none);
  EXPECT_EQ(parse_trace_place("").destination, Trace_Destination::none);
}

TEST(TracePlace, StandardErrorAndSystemLogGoByTheirNames) {
  EXPECT_EQ(parse_trace_place("stderr").destination, Trace_Destination::standard_error);
  EXPECT_EQ(parse_trace_place("syslog").destination, Trace_Destination::system_log);
}

TEST(TracePlace, FileIsWhatFollowsTheColon) {
  const Trace_Place place = parse_trace_place("file:/var/log/a:b.trace");
  EXPECT_EQ(place.destination, Trace_Destination::file);
  EXPECT_EQ(place.path, "/var/log/a:b.trace");
}

TEST(TracePlace, AnythingElseIsRefusedWithWhatWouldDo) {
  expect_place_refused("stdout", "ZU_TRACE is \"stdout\", which is none of stderr, syslog, file:PATH");
  expect_place_refused("STDERR", "ZU_TRACE is \"STDERR\", which is none of stderr, syslog, file:PATH");
  expect_place_refused("/tmp/trace", "ZU_TRACE is \"/tmp/trace\", which is none of stderr, syslog, file:PATH");
  expect_place_refused("file:", "ZU_TRACE is \"file:\", which is none of stderr, syslog, file:PATH");
}

TEST(TraceDetail, IsInfoWhereNothingIsSet) {
  EXPECT_THAT(detail(nullptr), ElementsAre(true, true, false));
  EXPECT_THAT(detail(""), ElementsAre(true, true, false));
}

TEST(TraceDetail, EachWordIncludesTheWordsBeforeIt) {
  EXPECT_THAT(detail("errors"), ElementsAre(true, false, false));
  EXPECT_THAT(detail("info"), ElementsAre(true, true, false));
  EXPECT_THAT(detail("debug"), ElementsAre(true, true, true));
}

TEST(TraceDetail, ListMeansExactlyTheCategoriesNamed) {
  EXPECT_THAT(detail("Errors,Debug"), ElementsAre(true, false, true));
  EXPECT_THAT(detail("Debug,Info"), ElementsAre(false, true, true));
}

TEST(TraceDetail, CaseDoesNotMatter) {
  EXPECT_THAT(detail("DEBUG"), ElementsAre(true, true, true));
  EXPECT_THAT(detail("errors,DEBUG"), ElementsAre(true, false, true));
}

TEST(TraceDetail, CategoryOfAnotherNameGoesByItsName) {
  const std::array<tr_category, 2> others = {{{0, "Clients", 1, 0}, {1, "Packets", 2, 0}}};
  EXPECT_THAT(parse_trace_detail("packets", others), ElementsAre(false, true));
  EXPECT_THAT(parse_trace_detail("errors", others), ElementsAre(false, false));
}

TEST(TraceDetail, CategoryWithoutANameIsNeverMeant) {
  const std::array<tr_category, 1> nameless = {{{0, nullptr, 0, 0}}};
  EXPECT_THAT(parse_trace_detail("errors", nameless), ElementsAre(true));
  EXPECT_THROW(parse_trace_detail("Errors,Errors", nameless), Trace_Setting_Error);
}

TEST(TraceDetail, AnythingElseIsRefusedWithWhatWouldDo) {
  const std::string reason =
      ", which is none of errors, info, debug, and no list of category names separated by commas";
  expect_detail_refused("all", "ZU_TRACE_DETAIL is \"all\"" + reason);
  expect_detail_refused("Errors,all", "ZU_TRACE_DETAIL is \"Errors,all\"" + reason);
  expect_detail_refused("Errors,", "ZU_TRACE_DETAIL is \"Errors,\"" + reason);
  expect_detail_refused("Errors,,Info", "ZU_TRACE_DETAIL is \"Errors,,Info\"" + reason);
  expect_detail_refused("Errors, Info", "ZU_TRACE_DETAIL is \"Errors, Info\"" + reason);
}

}  // namespace
