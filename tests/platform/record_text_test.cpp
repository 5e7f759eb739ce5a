#include "record_text.h"

#include <gtest/gtest.h>

#include <array>
#include <string>
#include <vector>

namespace {

std::string text_of(const char* text, const std::vector<Trace_Value>& values) { return record_text(text, values); }

Trace_Data data_of(const std::string& bytes) { return {bytes.data(), static_cast<uint32_t>(bytes.size())}; }

TEST(RecordText, WithoutValuesIsTheCataloguesText) { EXPECT_EQ(text_of("socket removed", {}), "socket removed"); }

TEST(RecordText, ValuesStandInTheirOrder) {
  EXPECT_EQ(text_of("adapter {} loaded: node {}", {5U, 2U}), "adapter 5 loaded: node 2");
}

TEST(RecordText, ValuesAreSigned) {
  EXPECT_EQ(text_of("result {}", {0xFFFFFFFFU}), "result -1");
  EXPECT_EQ(text_of("result {}", {0x7FFFFFFFU}), "result 2147483647");
}

TEST(RecordText, ValueThatIsMissingIsAQuestionMark) {
  EXPECT_EQ(text_of("adapter {} loaded: node {}", {5U}), "adapter 5 loaded: node ?");
  EXPECT_EQ(text_of("name {text}", {}), "name ?");
}

TEST(RecordText, ValuesWithoutPlaceholderStandAtTheEnd) {
  EXPECT_EQ(text_of("node {}", {1U, 2U, 3U}), "node 1; further values: 2, 3");
  EXPECT_EQ(text_of("start failed", {"why"}), "start failed; further values: why");
}

TEST(RecordText, UnknownRecordShowsValuesDecimalAndHexadecimal) {
  EXPECT_EQ(text_of(nullptr, {0xFFFFFFFFU, 16U}), "record is not in the catalogue: -1 (0xffffffff), 16 (0x10)");
}

TEST(RecordText, UnknownRecordShowsDataAndStrings) {
  const std::string bytes("\x01\x02\x03", 3);
  EXPECT_EQ(text_of(nullptr, {data_of(bytes)}), "record is not in the catalogue: 0x010203");
  EXPECT_EQ(text_of(nullptr, {"a", "b"}), "record is not in the catalogue: a, b");
}

TEST(RecordText, UnknownRecordWithoutValuesSaysSo) {
  EXPECT_EQ(text_of(nullptr, {}), "record is not in the catalogue");
}

TEST(RecordText, DataOfFourBytesIsANumber) {
  const int32_t result = -1;
  const int32_t error = 2;
  EXPECT_EQ(text_of("result {}, errno {}", {Trace_Data{&result, 4}, Trace_Data{&error, 4}}), "result -1, errno 2");
}

TEST(RecordText, PrintableDataIsText) {
  EXPECT_EQ(text_of("type {}", {data_of("ether")}), "type ether");
  EXPECT_EQ(text_of("type {}", {data_of(std::string("ether\0", 6))}), "type ether");
  EXPECT_EQ(text_of("type {}", {data_of(std::string("ether\0\0\0\0", 9))}), "type ether");
}

TEST(RecordText, OtherDataIsHexadecimal) {
  EXPECT_EQ(text_of("data {}", {data_of(std::string("a\x80z", 3))}), "data 0x61807a");
  EXPECT_EQ(text_of("data {}", {data_of(std::string("ab\0cd", 5))}), "data 0x6162006364");
  EXPECT_EQ(text_of("data {}", {data_of(std::string("\0\0\0", 3))}), "data 0x000000");
  EXPECT_EQ(text_of("data {}", {data_of(std::string())}), "data 0x");
}

TEST(RecordText, TextPlaceholderTakesDataOfFourBytesAsText) {
  EXPECT_EQ(text_of("type {text}", {data_of(std::string("en0\0", 4))}), "type en0");
  EXPECT_EQ(text_of("type {text}", {data_of("eth0")}), "type eth0");
}

TEST(RecordText, TextPlaceholderEndsAtTheFirstNul) {
  EXPECT_EQ(text_of("type {text}.", {data_of(std::string("ab\0cd", 5))}), "type ab.");
  EXPECT_EQ(text_of("type {text}.", {data_of(std::string("\0\0", 2))}), "type .");
}

TEST(RecordText, NumberPlaceholderTakesTwoFourAndEightBytes) {
  const int16_t two = -2;
  const int32_t four = -4;
  const int64_t eight = 5000000000;
  EXPECT_EQ(text_of("{number} {number} {number}", {Trace_Data{&two, 2}, Trace_Data{&four, 4}, Trace_Data{&eight, 8}}),
            "-2 -4 5000000000");
  EXPECT_EQ(text_of("{number}", {data_of("abc")}), "0x616263");
}

TEST(RecordText, RecordStaysOneLine) {
  EXPECT_EQ(text_of("name {}", {"two\nlines\x1b[0m"}), "name two\\x0alines\\x1b[0m");
  EXPECT_EQ(text_of("name {text}", {data_of("two\nlines")}), "name two\\x0alines");
}

TEST(RecordText, NullsAreShownAsSuch) {
  EXPECT_EQ(text_of("name {}", {static_cast<const char*>(nullptr)}), "name (null)");
  EXPECT_EQ(text_of("data {}", {Trace_Data{nullptr, 100}}), "data (null)");
}

TEST(RecordText, LongTextIsCut) {
  const std::string longest(256, 'x');
  EXPECT_EQ(text_of("{}", {longest.c_str()}), longest);
  EXPECT_EQ(text_of("{}", {(longest + "y").c_str()}), longest + "...");
  EXPECT_EQ(text_of("{text}", {data_of(longest)}), longest);
  EXPECT_EQ(text_of("{text}", {data_of(longest + "y")}), longest + "...");
}

TEST(RecordText, LongBlockIsCut) {
  const std::string longest(64, '\x01');
  std::string shown = "0x";
  for (int index = 0; index < 64; ++index) shown += "01";
  EXPECT_EQ(text_of("{}", {data_of(longest)}), shown);
  EXPECT_EQ(text_of("{}", {data_of(longest + '\x01')}), shown + "... (65 bytes)");
}

TEST(RecordText, BracesInValuesAreNotPlaceholders) {
  EXPECT_EQ(text_of("name {}, number {}", {"{}", 3U}), "name {}, number 3");
}

}  // namespace
