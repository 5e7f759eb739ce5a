// The keys of one publication: what is read again, what is given up and said, and that nothing is kept. The functions
// of the library that it calls are scripted here, in the program, and so come before the library's.
#include "security_keys.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <string>
#include <vector>

#include "errors.h"

namespace {

// What the next calls say, and what was called.
struct ScriptedLibrary {
  std::vector<Hb_Rc> of_sequence;               // the last one again when they have run out
  bool changes_with_every_look = false;         // a publication between any two looks at the number
  std::vector<Hb_Sequence_Number> sequences{};  // the last one again when they have run out
  Hb_Rc of_keys = Hb_Success;
  size_t looks = 0;
  size_t reads = 0;
  size_t releases = 0;
};

ScriptedLibrary library;

template <typename Value>
Value at_or_last(const std::vector<Value>& values, size_t place) {
  return values[std::min(place, values.size() - 1)];
}

}  // namespace

extern "C" Hb_Rc hb_get_security_sequence(Hb_Sequence_Number* sequence) {
  const size_t look = library.looks++;
  const Hb_Rc result = at_or_last(library.of_sequence, look);
  if (result == Hb_Success) {
    *sequence =
        library.changes_with_every_look ? static_cast<Hb_Sequence_Number>(look) : at_or_last(library.sequences, look);
  }
  return result;
}

extern "C" Hb_Rc hb_get_security_infomation(Hb_Security_Status* current, Hb_Security_Status*, Hb_Key_Cache*) {
  ++library.reads;
  current->keyCount = static_cast<int32_t>(library.reads);
  return library.of_keys;
}

extern "C" Hb_Rc hb_free_security_info_keys(Hb_Security_Status*, Hb_Security_Status*, Hb_Key_Cache*) {
  ++library.releases;
  return Hb_Success;
}

namespace hbctl {
namespace {

class HbctlSecurityKeys : public testing::Test {
 protected:
  HbctlSecurityKeys() { library = {.of_sequence = {Hb_Success}, .sequences = {5}}; }

  // How the reading ends, and with which status.
  static std::string failure() {
    try {
      const SecurityKeys keys;
    } catch (const CommandError& error) {
      EXPECT_EQ(error.status(), ExitStatus::Failed);
      EXPECT_EQ(error.number(), 0);
      return error.what();
    }
    return "none";
  }
};

TEST_F(HbctlSecurityKeys, are_read_once_when_the_number_stays) {
  {
    const SecurityKeys keys;
    EXPECT_EQ(keys.sequence(), 5);
    EXPECT_EQ(library.reads, 1U);
    EXPECT_EQ(library.releases, 0U);
  }
  EXPECT_EQ(library.releases, 1U);
}

TEST_F(HbctlSecurityKeys, are_given_back_and_read_again_when_the_number_changed_meanwhile) {
  library.sequences = {5, 6, 6, 6};
  {
    const SecurityKeys keys;
    EXPECT_EQ(keys.sequence(), 6);
    EXPECT_EQ(keys.current().keyCount, 2);
    EXPECT_EQ(library.reads, 2U);
    EXPECT_EQ(library.releases, 1U);
  }
  EXPECT_EQ(library.releases, 2U);
}

TEST_F(HbctlSecurityKeys, that_change_all_the_time_are_given_up_and_each_reading_is_given_back) {
  library.changes_with_every_look = true;
  EXPECT_EQ(failure(), "cannot read the security keys: they change all the time\ntry again");
  EXPECT_EQ(library.reads, 100U);
  EXPECT_GE(library.releases, 100U);
}

TEST_F(HbctlSecurityKeys, that_nobody_publishes_are_told_as_such) {
  library.of_sequence = {Hb_Failure};
  EXPECT_EQ(failure(), "cannot read the security keys: none are published (the library gives no error number)");
  EXPECT_EQ(library.reads, 0U);
}

TEST_F(HbctlSecurityKeys, that_go_while_they_are_read_are_given_back) {
  library.of_sequence = {Hb_Success, Hb_Failure};
  EXPECT_EQ(failure(), "cannot read the security keys: none are published (the library gives no error number)");
  EXPECT_EQ(library.reads, 1U);
  EXPECT_GE(library.releases, 1U);
}

TEST_F(HbctlSecurityKeys, that_are_malformed_are_given_back_with_the_advice_to_change_them) {
  library.of_keys = Hb_Failure;
  EXPECT_EQ(failure(),
            "cannot read the security keys: one of them is malformed (the library gives no error number)\n"
            "have the daemon change its keys, or start it again");
  EXPECT_EQ(library.reads, 1U);
  EXPECT_GE(library.releases, 1U);
}

}  // namespace
}  // namespace hbctl
