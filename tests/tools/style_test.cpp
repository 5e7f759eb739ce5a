#include "style.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

namespace hbctl {
namespace {

TEST(HbctlStyle, puts_escapes_around_what_it_paints) {
  EXPECT_EQ(Style(true).apply(Paint::Bad, "down"), "\033[31mdown\033[0m");
  EXPECT_EQ(Style(true).apply(Paint::Good, "up"), "\033[32mup\033[0m");
  EXPECT_EQ(Style(true).apply(Paint::Doubtful, "unknown"), "\033[33munknown\033[0m");
}

TEST(HbctlStyle, leaves_plain_and_empty_text_alone) {
  EXPECT_EQ(Style(true).apply(Paint::Plain, "text"), "text");
  EXPECT_EQ(Style(true).apply(Paint::Bad, ""), "");
}

TEST(HbctlStyle, without_colour_leaves_text_alone) { EXPECT_EQ(Style(false).apply(Paint::Bad, "down"), "down"); }

TEST(HbctlStyle, follows_the_wish_and_otherwise_the_terminal) {
  const int no_terminal = open("/dev/null", O_WRONLY | O_CLOEXEC);
  EXPECT_TRUE(wants_colour("always", no_terminal));
  EXPECT_FALSE(wants_colour("never", no_terminal));
  EXPECT_FALSE(wants_colour("auto", no_terminal));
  close(no_terminal);
}

}  // namespace
}  // namespace hbctl
