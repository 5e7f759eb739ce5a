// Counted allocation, strings and installation paths.
#include "utils.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <new>
#include <string>
#include <utility>
#include <vector>

#include "hb_communication/connection.h"
#include "support/allocation_faults.h"

namespace {

std::vector<std::pair<void*, size_t>>* pinned = nullptr;
const int memchunks_at_start = memchunks;

}  // namespace

// The allocator's hook, recorded where a test asks for it.
extern "C" {
void __real__Z17mowl_pin_new_dataPvm(void* ptr, size_t size);
void __wrap__Z17mowl_pin_new_dataPvm(void* ptr, size_t size);
void __wrap__Z17mowl_pin_new_dataPvm(void* ptr, size_t size) {
  if (pinned != nullptr) {
    pinned->emplace_back(ptr, size);
  }
  __real__Z17mowl_pin_new_dataPvm(ptr, size);
}
}

namespace hb_test {
namespace {

// A text that may be changed, released at the end.
class Text {
 public:
  explicit Text(const std::string& text) : bytes_(text.begin(), text.end()) { bytes_.push_back('\0'); }
  char* get() { return bytes_.data(); }

 private:
  std::vector<char> bytes_;
};

TEST(Allocation, CountStartsAtZero) { EXPECT_EQ(memchunks_at_start, 0); }

TEST(Allocation, BlockHasTheSizeAskedForAndIsCounted) {
  const int before = memchunks;
  void* block = nullptr;
  cpp_malloc(&block, 37, "tag");
  ASSERT_NE(block, nullptr);
  EXPECT_EQ(last_allocation(), 37U);
  EXPECT_EQ(memchunks, before + 1);
  std::memset(block, 0x5a, 37);
  ccst_free(block);
}

TEST(Allocation, SizeZeroStoresNullAndDoesNotCount) {
  const int before = memchunks;
  int something = 0;
  void* block = &something;
  cpp_malloc(&block, 0, "tag");
  EXPECT_EQ(block, nullptr);
  EXPECT_EQ(memchunks, before);
}

TEST(Allocation, EachBlockIsOfferedToThePinningHookAndSizeZeroIsNot) {
  std::vector<std::pair<void*, size_t>> recorded;
  pinned = &recorded;
  void* block = nullptr;
  cpp_malloc(&block, 12, "tag");
  void* none = nullptr;
  cpp_malloc(&none, 0, "tag");
  pinned = nullptr;
  ASSERT_EQ(recorded.size(), 1U);
  EXPECT_EQ(recorded[0].first, block);
  EXPECT_EQ(recorded[0].second, 12U);
  ccst_free(block);
}

TEST(Allocation, PinningHookLeavesTheBlockAlone) {
  char block[] = "contents";
  mowl_pin_new_data(block, sizeof block);
  EXPECT_STREQ(block, "contents");
}

TEST(Allocation, FailureIsAnExceptionAndIsNotCounted) {
  const int before = memchunks;
  void* block = nullptr;
  bool threw = false;
  {
    const AllocationFailure failure(1);
    try {
      cpp_malloc(&block, 8, "tag");
    } catch (const std::bad_alloc&) {
      threw = true;
    }
  }
  EXPECT_TRUE(threw);
  EXPECT_EQ(block, nullptr);
  EXPECT_EQ(memchunks, before);
}

TEST(Release, ReleasesTheBlockAndLowersTheCount) {
  const int before = memchunks;
  const long live = live_allocations();
  void* block = nullptr;
  cpp_malloc(&block, 8, "tag");
  ASSERT_EQ(live_allocations(), live + 1);
  ccst_free(block);
  EXPECT_EQ(live_allocations(), live);
  EXPECT_EQ(memchunks, before);
}

TEST(Release, OfNullStillLowersTheCount) {
  const int before = memchunks;
  ccst_free(nullptr);
  EXPECT_EQ(memchunks, before - 1);
}

TEST(Release, OtherNameDoesTheSame) {
  const int before = memchunks;
  const long live = live_allocations();
  void* block = nullptr;
  cpp_malloc(&block, 8, "tag");
  my_free(block);
  EXPECT_EQ(memchunks, before);
  EXPECT_EQ(live_allocations(), live);
  my_free(nullptr);
  EXPECT_EQ(memchunks, before - 1);
}

TEST(RunDirectory, Is256ZeroBytes) {
  ASSERT_EQ(sizeof RUNDIR, 256U);
  EXPECT_TRUE(std::all_of(std::begin(RUNDIR), std::end(RUNDIR), [](char byte) { return byte == 0; }));
}

TEST(CopyString, CopiesTheTextWithItsTerminatorIntoACountedBlock) {
  const int before = memchunks;
  char text[] = "abc";
  char* copy = copy_string(text);
  EXPECT_EQ(last_allocation(), 4U);
  EXPECT_EQ(memchunks, before + 1);
  text[0] = 'x';
  EXPECT_STREQ(copy, "abc");
  ccst_free(copy);
}

TEST(CopyString, OfTheEmptyTextIsOneByte) {
  char* copy = copy_string("");
  EXPECT_EQ(last_allocation(), 1U);
  EXPECT_STREQ(copy, "");
  ccst_free(copy);
}

struct Word_Case {
  const char* name;
  const char* text;
  char separator;
  const char* expected;
};

std::string case_name(const testing::TestParamInfo<Word_Case>& info) { return info.param.name; }

class RemoveLastWord : public testing::TestWithParam<Word_Case> {};

TEST_P(RemoveLastWord, KeepsTheSeparatorAndReturnsItsArgument) {
  Text text(GetParam().text);
  EXPECT_EQ(remove_last_word(text.get(), GetParam().separator), text.get());
  EXPECT_STREQ(text.get(), GetParam().expected);
}

INSTANTIATE_TEST_SUITE_P(
    Texts, RemoveLastWord,
    testing::Values(Word_Case{"LastOfThree", "a/b/c", '/', "a/b/"},
                    Word_Case{"SeparatorInTheLastPositionDoesNotCount", "a/b/", '/', "a/"},
                    Word_Case{"WithoutSeparatorItIsEmptied", "abc", '/', ""}, Word_Case{"OnlyASeparator", "/", '/', ""},
                    Word_Case{"TwoSeparators", "//", '/', "/"}, Word_Case{"SeparatorInFront", "/abc", '/', "/"},
                    Word_Case{"SeparatorOnlyInTheLastPosition", "abc/", '/', ""}, Word_Case{"OneLetter", "a", '/', ""},
                    Word_Case{"Empty", "", '/', ""}, Word_Case{"AnotherSeparator", "one two three", ' ', "one two "}),
    case_name);

class RemoveFirstWord : public testing::TestWithParam<Word_Case> {};

TEST_P(RemoveFirstWord, KeepsWhatStandsBehindTheFirstSeparatorAndReturnsItsArgument) {
  Text text(GetParam().text);
  EXPECT_EQ(remove_first_word(text.get(), GetParam().separator), text.get());
  EXPECT_STREQ(text.get(), GetParam().expected);
}

INSTANTIATE_TEST_SUITE_P(Texts, RemoveFirstWord,
                         testing::Values(Word_Case{"FirstOfThree", "one two three", ' ', "two three"},
                                         Word_Case{"WithoutSeparatorItIsEmptied", "abc", ' ', ""},
                                         Word_Case{"SeparatorInFront", " abc", ' ', "abc"},
                                         Word_Case{"SeparatorAtTheEnd", "abc ", ' ', ""},
                                         Word_Case{"TwoSeparators", "a  b", ' ', " b"},
                                         Word_Case{"Empty", "", ' ', ""}),
                         case_name);

TEST(RemoveFirstWordBlock, HasTheLengthWithoutTheFirstWordAndIsReleased) {
  const int before = memchunks;
  const long live = live_allocations();
  char text[] = "one two three";
  remove_first_word(text, ' ');
  EXPECT_EQ(last_allocation(), 10U);  // 13 characters less the 3 in front of the separator
  EXPECT_EQ(memchunks, before);
  EXPECT_EQ(live_allocations(), live);
}

TEST(TwoStrings, LieOneAfterTheOtherWithTheirTerminators) {
  const int before = memchunks;
  Text a("ab");
  Text b("cde");
  char* both = make_2_strings(a.get(), b.get());
  EXPECT_EQ(last_allocation(), 7U);
  EXPECT_EQ(memchunks, before + 1);
  EXPECT_EQ(std::string(both, 7), std::string("ab\0cde\0", 7));
  ccst_free(both);
}

TEST(TwoStrings, ComeBackInBlocksOfTheirOwn) {
  const int before = memchunks;
  char both[] = {'a', 'b', '\0', 'c', 'd', 'e', '\0'};
  char* a = nullptr;
  char* b = nullptr;
  EXPECT_EQ(get_2_strings(both, &a, &b), 0);
  EXPECT_EQ(memchunks, before + 2);
  both[0] = both[3] = 'x';
  EXPECT_STREQ(a, "ab");
  EXPECT_STREQ(b, "cde");
  ccst_free(a);
  ccst_free(b);
}

TEST(TwoStrings, MayBothBeEmpty) {
  Text a("");
  Text b("");
  char* both = make_2_strings(a.get(), b.get());
  EXPECT_EQ(last_allocation(), 2U);
  EXPECT_EQ(std::string(both, 2), std::string(2, '\0'));
  char* first = nullptr;
  char* second = nullptr;
  EXPECT_EQ(get_2_strings(both, &first, &second), 0);
  EXPECT_STREQ(first, "");
  EXPECT_STREQ(second, "");
  ccst_free(both);
  ccst_free(first);
  ccst_free(second);
}

TEST(SyntaxError, IsToldOnStandardErrorWithItsSubject) {
  Text what("the file");
  testing::internal::CaptureStderr();
  syntax_error(what.get());
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "\n******************** the file: syntax error *******\n\n");
}

TEST(InstallationPath, InTheOldDirectoryMovesToTheNewOne) {
  EXPECT_EQ(convert_usr_sbin_qarn_path_to_opt_qarn_path("/usr/sbin/qarn/bin/x"), "/opt/qarn/bin/x");
  EXPECT_EQ(convert_usr_sbin_qarn_path_to_opt_qarn_path("/usr/sbin/qarn/"), "/opt/qarn/");
}

TEST(InstallationPath, OfTheDirectoryWithoutItsSlashStays) {
  EXPECT_EQ(convert_usr_sbin_qarn_path_to_opt_qarn_path("/usr/sbin/qarn"), "/usr/sbin/qarn");
}

TEST(InstallationPath, ElsewhereStays) {
  EXPECT_EQ(convert_usr_sbin_qarn_path_to_opt_qarn_path("/usr/sbin/qarns/bin/x"), "/usr/sbin/qarns/bin/x");
  EXPECT_EQ(convert_usr_sbin_qarn_path_to_opt_qarn_path("x/usr/sbin/qarn/y"), "x/usr/sbin/qarn/y");
  EXPECT_EQ(convert_usr_sbin_qarn_path_to_opt_qarn_path(""), "");
}

TEST(InstallationPath, OfNullIsEmpty) { EXPECT_EQ(convert_usr_sbin_qarn_path_to_opt_qarn_path(nullptr), ""); }

}  // namespace
}  // namespace hb_test
