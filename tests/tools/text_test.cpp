#include "text.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>

namespace hbctl {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;

TEST(HbctlText, shows_control_characters_as_question_marks) {
  EXPECT_EQ(printable("plain n\xC3\xA4me"), "plain n\xC3\xA4me");
  EXPECT_EQ(printable("a\033[1mb\nc\x7F"), "a?[1mb?c?");
}

TEST(HbctlText, joins_runs_of_numbers_into_ranges) {
  EXPECT_EQ(number_ranges({}), "none");
  EXPECT_EQ(number_ranges({7}), "7");
  EXPECT_EQ(number_ranges({0, 1, 2, 3, 7}), "0-3, 7");
  EXPECT_EQ(number_ranges({5, 3, 4, 9, 1}), "1, 3-5, 9");
  EXPECT_EQ(number_ranges({2, 2, 3}), "2-3");
}

TEST(HbctlText, counts_in_singular_and_plural) {
  EXPECT_EQ(count_of(0, "node"), "0 nodes");
  EXPECT_EQ(count_of(1, "node"), "1 node");
  EXPECT_EQ(count_of(2, "node"), "2 nodes");
}

TEST(HbctlText, writes_timestamps_in_utc_to_the_millisecond) {
  // 2001-09-09T01:46:40Z is the second 1,000,000,000.
  const WallClock::time_point time{seconds(1000000000) + milliseconds(7)};
  EXPECT_EQ(utc_timestamp(time), "2001-09-09T01:46:40.007Z");
}

TEST(HbctlText, writes_the_time_of_day_of_the_place) {
  setenv("TZ", "<+02>-2", 1);  // two hours east
  tzset();
  const WallClock::time_point time{seconds(1000000000) + milliseconds(120)};
  EXPECT_EQ(time_of_day(time), "03:46:40.120");
}

}  // namespace
}  // namespace hbctl
