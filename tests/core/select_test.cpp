// Waiting with select.
#include "platform/Hb_Select.h"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>

#include "support/bytes.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

// The base with its fields in the open.
class Open_Base : public Hb_Select_Base {
 public:
  Hb_Rc wait() override { return Hb_Success; }
  using Hb_Select_Base::ex_count;
  using Hb_Select_Base::ex_fds;
  using Hb_Select_Base::ex_fds_ptr;
  using Hb_Select_Base::myError;
  using Hb_Select_Base::rd_count;
  using Hb_Select_Base::rd_fds;
  using Hb_Select_Base::rd_fds_ptr;
  using Hb_Select_Base::wait_time;
  using Hb_Select_Base::wait_time_ptr;
  using Hb_Select_Base::wr_count;
  using Hb_Select_Base::wr_fds;
  using Hb_Select_Base::wr_fds_ptr;
};

class Open_Select : public Hb_Select {
 public:
  using Hb_Select::ex_count;
  using Hb_Select::ex_fds_ptr;
  using Hb_Select::rd_count;
  using Hb_Select::rd_fds;
  using Hb_Select::rd_fds_ptr;
  using Hb_Select::wait_time;
  using Hb_Select::wait_time_ptr;
  using Hb_Select::wr_count;
  using Hb_Select::wr_fds_ptr;
};

// The three families of operations, to be tested alike.
struct Readable {
  static void zero(Hb_Select_Base& s) { s.rd_zero(); }
  static void set(Hb_Select_Base& s, int fd) { s.rd_set(fd); }
  static void clear(Hb_Select_Base& s, int fd) { s.rd_clr(fd); }
  static int is_set(const Hb_Select_Base& s, int fd) { return s.rd_isset(fd); }
  static fd_set& bits(Open_Base& s) { return s.rd_fds; }
  static fd_set* pointer(Open_Base& s) { return s.rd_fds_ptr; }
  static int32_t count(Open_Base& s) { return s.rd_count; }
};

struct Writable {
  static void zero(Hb_Select_Base& s) { s.wr_zero(); }
  static void set(Hb_Select_Base& s, int fd) { s.wr_set(fd); }
  static void clear(Hb_Select_Base& s, int fd) { s.wr_clr(fd); }
  static int is_set(const Hb_Select_Base& s, int fd) { return s.wr_isset(fd); }
  static fd_set& bits(Open_Base& s) { return s.wr_fds; }
  static fd_set* pointer(Open_Base& s) { return s.wr_fds_ptr; }
  static int32_t count(Open_Base& s) { return s.wr_count; }
};

struct Exceptional {
  static void zero(Hb_Select_Base& s) { s.ex_zero(); }
  static void set(Hb_Select_Base& s, int fd) { s.ex_set(fd); }
  static void clear(Hb_Select_Base& s, int fd) { s.ex_clr(fd); }
  static int is_set(const Hb_Select_Base& s, int fd) { return s.ex_isset(fd); }
  static fd_set& bits(Open_Base& s) { return s.ex_fds; }
  static fd_set* pointer(Open_Base& s) { return s.ex_fds_ptr; }
  static int32_t count(Open_Base& s) { return s.ex_count; }
};

template <typename Family>
class SelectSet : public testing::Test {
 protected:
  // Word of the set that holds the bits of 64 descriptors.
  uint64_t word(size_t index) {
    uint64_t words[16];
    static_assert(sizeof words == sizeof(fd_set));
    std::memcpy(words, &Family::bits(select), sizeof words);
    return words[index];
  }

  bool all_clear() {
    for (size_t index = 0; index < 16; ++index) {
      if (word(index) != 0) {
        return false;
      }
    }
    return true;
  }

  Open_Base select;
};

using Families = testing::Types<Readable, Writable, Exceptional>;
TYPED_TEST_SUITE(SelectSet, Families);

TYPED_TEST(SelectSet, StartsClear) {
  EXPECT_EQ(TypeParam::count(this->select), 0);
  EXPECT_EQ(TypeParam::pointer(this->select), nullptr);
  EXPECT_TRUE(this->all_clear());
}

TYPED_TEST(SelectSet, SetCountsPointsAndSetsTheBit) {
  TypeParam::set(this->select, 0);
  EXPECT_EQ(TypeParam::count(this->select), 1);
  EXPECT_EQ(TypeParam::pointer(this->select), &TypeParam::bits(this->select));
  EXPECT_EQ(this->word(0), 1U);
  TypeParam::set(this->select, 63);
  TypeParam::set(this->select, 64);
  TypeParam::set(this->select, 1023);
  EXPECT_EQ(TypeParam::count(this->select), 4);
  EXPECT_EQ(this->word(0), 0x8000000000000001U);
  EXPECT_EQ(this->word(1), 1U);
  EXPECT_EQ(this->word(15), 0x8000000000000000U);
}

TYPED_TEST(SelectSet, SetTwiceCountsTwice) {
  TypeParam::set(this->select, 5);
  TypeParam::set(this->select, 5);
  EXPECT_EQ(TypeParam::count(this->select), 2);
  EXPECT_EQ(this->word(0), 32U);
}

TYPED_TEST(SelectSet, IssetIsOneOrZero) {
  TypeParam::set(this->select, 100);
  EXPECT_EQ(TypeParam::is_set(this->select, 100), 1);
  EXPECT_EQ(TypeParam::is_set(this->select, 99), 0);
  EXPECT_EQ(TypeParam::is_set(this->select, 36), 0);
}

TYPED_TEST(SelectSet, ClearToZeroForgetsThePointer) {
  TypeParam::set(this->select, 5);
  TypeParam::clear(this->select, 5);
  EXPECT_EQ(TypeParam::count(this->select), 0);
  EXPECT_EQ(TypeParam::pointer(this->select), nullptr);
  EXPECT_TRUE(this->all_clear());
}

TYPED_TEST(SelectSet, ClearAboveZeroKeepsThePointer) {
  TypeParam::set(this->select, 5);
  TypeParam::set(this->select, 5);
  TypeParam::clear(this->select, 5);
  EXPECT_EQ(TypeParam::count(this->select), 1);
  EXPECT_EQ(TypeParam::pointer(this->select), &TypeParam::bits(this->select));
  EXPECT_EQ(TypeParam::is_set(this->select, 5), 0);
}

TYPED_TEST(SelectSet, ClearOfADescriptorNeverSetMakesTheCountNegative) {
  TypeParam::clear(this->select, 5);
  EXPECT_EQ(TypeParam::count(this->select), -1);
  EXPECT_EQ(TypeParam::pointer(this->select), nullptr);
  TypeParam::set(this->select, 6);  // the count is 0 now, and the set is pointed at all the same
  EXPECT_EQ(TypeParam::count(this->select), 0);
  EXPECT_EQ(TypeParam::pointer(this->select), &TypeParam::bits(this->select));
  TypeParam::clear(this->select, 6);
  EXPECT_EQ(TypeParam::count(this->select), -1);
  EXPECT_EQ(TypeParam::pointer(this->select), &TypeParam::bits(this->select));  // only exactly 0 forgets it
}

TYPED_TEST(SelectSet, ZeroStartsAfresh) {
  TypeParam::set(this->select, 5);
  TypeParam::set(this->select, 1000);
  TypeParam::zero(this->select);
  EXPECT_EQ(TypeParam::count(this->select), 0);
  EXPECT_EQ(TypeParam::pointer(this->select), nullptr);
  EXPECT_TRUE(this->all_clear());
}

TYPED_TEST(SelectSet, IsIndependentOfTheOthers) {
  TypeParam::set(this->select, 5);
  EXPECT_EQ(this->select.rd_count + this->select.wr_count + this->select.ex_count, 1);
  EXPECT_EQ(this->select.rd_isset(5) + this->select.wr_isset(5) + this->select.ex_isset(5), 1);
}

TYPED_TEST(SelectSet, HoldsNoDescriptorOf1024AndUp) {
  TypeParam::set(this->select, 1024);
  TypeParam::set(this->select, -1);
  EXPECT_TRUE(this->all_clear());
  EXPECT_EQ(TypeParam::is_set(this->select, 1024), 0);
  EXPECT_EQ(TypeParam::is_set(this->select, -1), 0);
  EXPECT_EQ(TypeParam::is_set(this->select, 1 << 20), 0);
}

TYPED_TEST(SelectSet, WithADescriptorOf1024AndUpCannotBeWaitedFor) {
  Hb_Select selector;
  SystemCalls calls;
  TypeParam::set(selector, 1024);
  EXPECT_EQ(selector.wait(), Hb_Failure);
  EXPECT_EQ(selector.Error(), 1);
  EXPECT_TRUE(calls.of("select").empty());
  TypeParam::clear(selector, 1024);
  EXPECT_EQ(selector.wait(), Hb_Success);
  TypeParam::set(selector, 5000);
  EXPECT_EQ(selector.wait(), Hb_Failure);
  TypeParam::zero(selector);
  EXPECT_EQ(selector.wait(), Hb_Success);
}

// The base's own state.

TEST(SelectBase, WaitsTenSecondsUnlessToldOtherwise) {
  Open_Base base;
  EXPECT_EQ(base.wait_time.tv_sec, 10);
  EXPECT_EQ(base.wait_time.tv_usec, 0);
  EXPECT_EQ(base.wait_time_ptr, &base.wait_time);
  EXPECT_EQ(base.myError, 0);
  EXPECT_EQ(base.Error(), 0);
}

TEST(SelectBase, ErrorIsItsField) {
  Open_Base base;
  base.myError = 42;
  EXPECT_EQ(base.Error(), 42);
}

TEST(SelectBase, FieldsLieInTheirOrder) {
  Open_Base base;
  const auto offset = [&base](const void* field) {
    return static_cast<const char*>(field) - reinterpret_cast<const char*>(&base);
  };
  EXPECT_EQ(offset(&base.myError), 8);
  EXPECT_EQ(offset(&base.rd_fds), 16);
  EXPECT_EQ(offset(&base.wr_fds), 144);
  EXPECT_EQ(offset(&base.ex_fds), 272);
  EXPECT_EQ(offset(&base.rd_fds_ptr), 400);
  EXPECT_EQ(offset(&base.wr_fds_ptr), 408);
  EXPECT_EQ(offset(&base.ex_fds_ptr), 416);
  EXPECT_EQ(offset(&base.rd_count), 424);
  EXPECT_EQ(offset(&base.wr_count), 428);
  EXPECT_EQ(offset(&base.ex_count), 432);
  EXPECT_EQ(offset(&base.wait_time), 440);
  EXPECT_EQ(offset(&base.wait_time_ptr), 456);
}

// Slot of a virtual function, as a pointer to it holds it.
template <typename Pointer>
long slot_of(Pointer pointer) {
  static_assert(sizeof pointer == 16);
  long words[2];
  std::memcpy(words, &pointer, sizeof words);
  EXPECT_EQ(words[0] % 8, 1) << "not virtual";
  return words[0] / 8;
}

TEST(SelectBase, VirtualOperationsHaveTheirSlots) {
  // Slots 0 and 1 are the destructor's.
  EXPECT_EQ(slot_of(&Hb_Select_Base::Error), 2);
  EXPECT_EQ(slot_of(&Hb_Select_Base::rd_zero), 3);
  EXPECT_EQ(slot_of(&Hb_Select_Base::rd_clr), 4);
  EXPECT_EQ(slot_of(&Hb_Select_Base::rd_set), 5);
  EXPECT_EQ(slot_of(&Hb_Select_Base::rd_isset), 6);
  EXPECT_EQ(slot_of(&Hb_Select_Base::wr_zero), 7);
  EXPECT_EQ(slot_of(&Hb_Select_Base::wr_clr), 8);
  EXPECT_EQ(slot_of(&Hb_Select_Base::wr_set), 9);
  EXPECT_EQ(slot_of(&Hb_Select_Base::wr_isset), 10);
  EXPECT_EQ(slot_of(&Hb_Select_Base::ex_zero), 11);
  EXPECT_EQ(slot_of(&Hb_Select_Base::ex_clr), 12);
  EXPECT_EQ(slot_of(&Hb_Select_Base::ex_set), 13);
  EXPECT_EQ(slot_of(&Hb_Select_Base::ex_isset), 14);
  EXPECT_EQ(slot_of(&Hb_Select_Base::wait), 15);
}

TEST(SelectTimeout, NonBlockingIsZeroAndPointedAt) {
  Open_Base base;
  base.wait_time_ptr = nullptr;
  base.non_blocking_timeout();
  EXPECT_EQ(base.wait_time.tv_sec, 0);
  EXPECT_EQ(base.wait_time.tv_usec, 0);
  EXPECT_EQ(base.wait_time_ptr, &base.wait_time);
}

TEST(SelectTimeout, IsCopiedAndPointedAt) {
  Open_Base base;
  base.wait_time_ptr = nullptr;
  timeval time = {3, 500};
  base.timeout(time);
  time = {0, 0};
  EXPECT_EQ(base.wait_time.tv_sec, 3);
  EXPECT_EQ(base.wait_time.tv_usec, 500);
  EXPECT_EQ(base.wait_time_ptr, &base.wait_time);
}

TEST(SelectTimeout, BlockingIsNoTimeoutAtAll) {
  Hb_Select select;
  select.blocking_timeout();
  SystemCalls calls;
  calls.script("select", {result(0)});
  EXPECT_EQ(select.wait(), Hb_Success);
  EXPECT_EQ(calls.of("select")[0].arguments[4], 0);
}

// Waiting.

class Select : public testing::Test {
 protected:
  Select() {
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM, 0, pair), 0);
    EXPECT_LT(pair[0], 1024);
  }
  ~Select() override {
    close(pair[0]);
    close(pair[1]);
  }

  int pair[2] = {-1, -1};
  Hb_Select select;
};

TEST_F(Select, FreshHoldsNothingAndPolls) {
  Open_Select fresh;
  EXPECT_EQ(fresh.rd_count + fresh.wr_count + fresh.ex_count, 0);
  EXPECT_EQ(fresh.rd_fds_ptr, nullptr);
  EXPECT_EQ(fresh.wr_fds_ptr, nullptr);
  EXPECT_EQ(fresh.ex_fds_ptr, nullptr);
  EXPECT_EQ(fresh.wait_time.tv_sec, 0);
  EXPECT_EQ(fresh.wait_time.tv_usec, 0);
  EXPECT_EQ(fresh.wait_time_ptr, &fresh.wait_time);
  EXPECT_EQ(fresh.Error(), 0);
}

TEST_F(Select, FreshReturnsAtOnceWithSuccess) { EXPECT_EQ(select.wait(), Hb_Success); }

TEST_F(Select, PassesAllThreeSetsWhateverTheirCounts) {
  Open_Select open;
  const auto& sets = open;
  SystemCalls calls;
  EXPECT_EQ(open.wait(), Hb_Success);
  ASSERT_EQ(calls.of("select").size(), 1U);
  const SystemCall& call = calls.of("select")[0];
  EXPECT_EQ(call.arguments[0], 1024);
  EXPECT_EQ(call.arguments[1], reinterpret_cast<intptr_t>(&sets.rd_fds));
  EXPECT_EQ(call.arguments[2], call.arguments[1] + 128);
  EXPECT_EQ(call.arguments[3], call.arguments[1] + 256);
  EXPECT_EQ(call.arguments[4], reinterpret_cast<intptr_t>(&sets.wait_time));
  EXPECT_EQ(call.bytes, std::string(400, '\0'));
}

TEST_F(Select, PassesTheTimeGiven) {
  select.timeout({7, 9});
  SystemCalls calls;
  calls.script("select", {result(0)});
  EXPECT_EQ(select.wait(), Hb_Success);
  EXPECT_EQ(u64_at(calls.of("select")[0].bytes, 384), 7U);
  EXPECT_EQ(u64_at(calls.of("select")[0].bytes, 392), 9U);
}

TEST_F(Select, TimeoutIsASuccessWithNothingSet) {
  select.rd_set(pair[0]);
  select.ex_set(pair[0]);
  EXPECT_EQ(select.wait(), Hb_Success);
  EXPECT_EQ(select.rd_isset(pair[0]), 0);
  EXPECT_EQ(select.ex_isset(pair[0]), 0);
}

TEST_F(Select, LeavesInTheSetsWhatIsReady) {
  ASSERT_EQ(write(pair[1], "x", 1), 1);
  select.rd_set(pair[0]);
  select.rd_set(pair[1]);
  select.wr_set(pair[0]);
  EXPECT_EQ(select.wait(), Hb_Success);
  EXPECT_EQ(select.rd_isset(pair[0]), 1);
  EXPECT_EQ(select.rd_isset(pair[1]), 0);
  EXPECT_EQ(select.wr_isset(pair[0]), 1);
}

TEST_F(Select, WaitsForAClosedDescriptorInVain) {
  const int closed = dup(pair[0]);
  close(closed);
  select.rd_set(closed);
  EXPECT_EQ(select.wait(), Hb_Failure);
  EXPECT_EQ(select.Error(), 1);
}

class SelectError : public testing::TestWithParam<std::pair<int, int>> {};

TEST_P(SelectError, FollowsFromErrno) {
  Hb_Select select;
  SystemCalls calls;
  calls.script("select", {fail(GetParam().first)});
  EXPECT_EQ(select.wait(), Hb_Failure);
  EXPECT_EQ(select.Error(), GetParam().second);
  EXPECT_EQ(select.Hb_Select_Base::Error(), 0);  // the base's field is another one
}

INSTANTIATE_TEST_SUITE_P(Errors, SelectError,
                         testing::Values(std::pair(EINTR, 3), std::pair(EBADF, 1), std::pair(EAGAIN, 7),
                                         std::pair(EFAULT, 5), std::pair(EINVAL, 4), std::pair(ENOMEM, 6),
                                         std::pair(EIO, 6)));

TEST_F(Select, ErrorStaysUntilTheNextFailure) {
  SystemCalls calls;
  calls.script("select", {fail(EINVAL), pass(), fail(EINTR)});
  EXPECT_EQ(select.wait(), Hb_Failure);
  EXPECT_EQ(select.wait(), Hb_Success);
  EXPECT_EQ(select.Error(), 4);
  EXPECT_EQ(select.wait(), Hb_Failure);
  EXPECT_EQ(select.Error(), 3);
}

TEST(SelectCodes, HaveTheirNumbers) {
  EXPECT_EQ(Hb_Select_NO_ERROR, 0);
  EXPECT_EQ(Hb_Select_INVALID_DESCRIPTOR, 1);
  EXPECT_EQ(Hb_Select_INTERNAL_DATA_ERROR, 2);
  EXPECT_EQ(Hb_Select_CAUGHT_SIGNAL, 3);
  EXPECT_EQ(Hb_Select_INVALID_DATA_VALUE, 4);
  EXPECT_EQ(Hb_Select_INVALID_DATA_POINTER, 5);
  EXPECT_EQ(Hb_Select_WAIT_ERROR, 6);
  EXPECT_EQ(Hb_Select_EAGAIN, 7);
}

}  // namespace
}  // namespace hb_test
