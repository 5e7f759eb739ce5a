#include "table.h"

#include <gtest/gtest.h>

namespace hbctl {
namespace {

const Style kPlain(false);
const Style kColoured(true);

TEST(HbctlTable, aligns_columns_under_their_headings) {
  Table table({{"NUMBER", Align::Right}, {"NAME"}, {"UP", Align::Right}});
  table.add({{"1"}, {"a"}, {"100"}});
  table.add({{"1234567"}, {"long name"}, {"2"}});
  EXPECT_EQ(table.render(kPlain),
            " NUMBER  NAME        UP\n"
            "      1  a          100\n"
            "1234567  long name    2\n");
}

TEST(HbctlTable, has_a_heading_without_rows) { EXPECT_EQ(Table({{"A"}, {"B"}}).render(kPlain), "A  B\n"); }

TEST(HbctlTable, leaves_no_space_at_the_end_of_a_line) {
  Table table({{"A"}, {"LONG"}});
  table.add({{"1"}, {"x"}});
  table.add({{"2"}});
  EXPECT_EQ(table.render(kPlain), "A  LONG\n1  x\n2\n");
}

TEST(HbctlTable, keeps_the_place_of_an_empty_cell) {
  Table table({{"A"}, {"B"}, {"C"}});
  table.add({{"1"}, {""}, {"3"}});
  EXPECT_EQ(table.render(kPlain), "A  B  C\n1     3\n");
}

TEST(HbctlTable, counts_characters_and_not_bytes) {
  Table table({{"NAME"}, {"X"}});
  table.add({{"n\xC3\xA4m\xC3\xA9s"}, {"1"}});
  EXPECT_EQ(table.render(kPlain), "NAME   X\nn\xC3\xA4m\xC3\xA9s  1\n");
}

TEST(HbctlTable, is_aligned_with_colour_as_without) {
  Table table({{"STATE"}, {"X"}});
  table.add({{"up", Paint::Good}, {"1"}});
  EXPECT_EQ(table.render(kColoured),
            "\033[1mSTATE\033[0m  \033[1mX\033[0m\n"
            "\033[32mup\033[0m     1\n");
}

}  // namespace
}  // namespace hbctl
