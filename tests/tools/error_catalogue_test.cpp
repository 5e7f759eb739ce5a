#include "error_catalogue.h"

#include <gtest/gtest.h>

#include <fstream>
#include <regex>

namespace hbctl {
namespace {

TEST(HbctlErrorCatalogue, tells_name_number_and_meaning) {
  EXPECT_EQ(describe_error(15), "HB_ECONNECT (15), the daemon's socket could not be connected to");
  EXPECT_EQ(describe_error(33), "HB_ESHMGET_NOENT (33), getting a segment: the daemon has not published it");
}

TEST(HbctlErrorCatalogue, has_the_number_of_an_error_without_a_name) {
  EXPECT_EQ(error_name(40), "unknown error");
  EXPECT_EQ(describe_error(40), "unknown error (40)");
}

TEST(HbctlErrorCatalogue, has_every_error_of_the_library) {
  std::ifstream header(HB_ERROR_HEADER);
  const std::regex enumerator(R"(^\s*(HB_E\w+) = (\d+),?.*)");
  int found = 0;
  for (std::string line; std::getline(header, line);) {
    std::smatch match;
    if (!std::regex_match(line, match, enumerator)) continue;
    ++found;
    EXPECT_EQ(error_name(std::stoi(match[2])), match[1]);
  }
  EXPECT_EQ(found, 76);
}

}  // namespace
}  // namespace hbctl
