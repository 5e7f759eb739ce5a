#include "catalogue.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <map>
#include <regex>
#include <string>
#include <vector>

namespace {

// The names and numbers of lib/trace_records.h.
std::map<uint32_t, std::string> enumerators() {
  std::ifstream file(TRACE_RECORDS_HEADER);
  const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  const std::regex enumerator(R"(\n\s*(trace_\w+)\s*=\s*(\d+),)");
  std::map<uint32_t, std::string> found;
  for (std::sregex_iterator each(text.begin(), text.end(), enumerator), end; each != end; ++each) {
    found[static_cast<uint32_t>(std::stoul((*each)[2]))] = (*each)[1];
  }
  return found;
}

size_t count_of(const std::string& text, const std::string& part) {
  size_t count = 0;
  for (size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + part.size())) ++count;
  return count;
}

size_t placeholders_of(const std::string& text) {
  return count_of(text, "{}") + count_of(text, "{text}") + count_of(text, "{number}");
}

TEST(Catalogue, HasEveryRecordThatTheLibraryMakes) {
  const std::map<uint32_t, std::string> records = enumerators();
  ASSERT_GE(records.size(), 30U) << "the header of the records was not read";
  for (const auto& [id, name] : records) EXPECT_NE(catalogue_text("_HBC", id), nullptr) << name << " = " << id;
}

// The records of the event monitors, which exist only where the operating system has them.
TEST(Catalogue, HasEveryRecordOfEventMonitorMode) {
  const std::vector<uint32_t> ids = {
      7,   8,   10,  11,  13,  14,  15,  28,  29,  32,  33,  35,  36,  44,  45,  47,  48,  49,  52,  55,  57,  58,  59,
      60,  66,  67,  68,  69,  71,  74,  75,  76,  77,  78,  79,  80,  81,  84,  85,  86,  90,  92,  95,  96,  97,  98,
      99,  100, 101, 102, 103, 104, 105, 106, 107, 108, 109, 112, 113, 116, 121, 122, 123, 124, 125, 126, 127, 128, 129,
      130, 131, 132, 134, 146, 154, 166, 168, 169, 170, 171, 172, 173, 174, 176, 177, 178, 179, 180, 181, 182, 183, 185,
      186, 187, 188, 189, 190, 191, 192, 198, 210, 213, 214, 219, 220, 221, 222, 223, 224, 225, 226, 227, 228, 229, 230,
      231, 233, 236, 238, 240, 243, 245, 246, 247, 248, 249, 250, 251, 252, 253, 254, 255, 256, 257, 258, 259, 262, 263,
      264, 265, 267, 271, 272, 273, 274, 275, 276, 277, 278, 279, 280, 281, 282, 283, 284, 285};
  for (const uint32_t id : ids) EXPECT_NE(catalogue_text("_HBC", id), nullptr) << id;
}

TEST(Catalogue, HasAPlaceholderForEachValue) {
  const std::map<uint32_t, size_t> values = {
      {8, 3},   {10, 5},  {11, 3},  {14, 1},  {15, 3},  {28, 2},  {32, 2},  {33, 3},  {35, 3},  {36, 4},  {45, 1},
      {47, 2},  {48, 1},  {55, 2},  {57, 1},  {58, 2},  {60, 3},  {69, 3},  {71, 3},  {79, 4},  {80, 2},  {81, 2},
      {84, 2},  {90, 2},  {92, 1},  {95, 3},  {97, 1},  {98, 2},  {99, 1},  {100, 2}, {101, 1}, {102, 2}, {104, 6},
      {116, 3}, {118, 2}, {119, 4}, {121, 1}, {122, 3}, {123, 4}, {132, 1}, {134, 6}, {146, 1}, {169, 2}, {170, 1},
      {171, 1}, {172, 2}, {173, 1}, {176, 2}, {177, 2}, {179, 1}, {247, 3}, {249, 3}, {256, 8}, {258, 3}, {262, 3},
      {264, 2}, {265, 1}, {267, 4}, {271, 4}, {273, 1}, {274, 1}, {275, 1}, {277, 1}, {278, 1}, {279, 1}, {284, 2},
      {285, 2}, {301, 2}, {302, 2}, {303, 2}, {310, 2}, {311, 2}, {312, 2}, {313, 1}, {314, 1}, {315, 1}, {321, 2},
      {322, 1}, {110, 0}, {111, 0}, {245, 0}, {250, 0}, {251, 0}, {252, 0}, {253, 0}, {272, 0}, {276, 0}, {320, 0}};
  for (const auto& [id, count] : values) {
    const char* text = catalogue_text("_HBC", id);
    ASSERT_NE(text, nullptr) << id;
    EXPECT_EQ(placeholders_of(text), count) << id << ": " << text;
  }
}

TEST(Catalogue, TextsAreOneLineWithoutStrayBraces) {
  for (const Catalogue_Entry& entry : hbc_catalogue()) {
    const std::string text = entry.text;
    EXPECT_FALSE(text.empty()) << entry.id;
    EXPECT_EQ(text.find('\n'), std::string::npos) << entry.id;
    EXPECT_EQ(count_of(text, "{"), placeholders_of(text)) << entry.id;
    EXPECT_EQ(count_of(text, "}"), placeholders_of(text)) << entry.id;
  }
}

TEST(Catalogue, TextsDiffer) {
  std::map<std::string, uint32_t> ids;
  for (const Catalogue_Entry& entry : hbc_catalogue()) {
    const auto [other, is_new] = ids.emplace(entry.text, entry.id);
    EXPECT_TRUE(is_new) << entry.id << " and " << other->second;
  }
}

TEST(Catalogue, KnowsTheTextsByComponentAndNumber) {
  EXPECT_STREQ(catalogue_text("_HBC", 276), "start failed");
  EXPECT_EQ(catalogue_text("_HBC", 0), nullptr);
  EXPECT_EQ(catalogue_text("_HBC", 9), nullptr);
  EXPECT_EQ(catalogue_text("_HBC", 4000000000U), nullptr);
  EXPECT_EQ(catalogue_text("_XYZ", 276), nullptr);
}

}  // namespace
