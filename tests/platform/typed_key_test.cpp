#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <new>
#include <vector>

#include "zu_mss.h"

using testing::Each;
using testing::ElementsAre;
using testing::SizeIs;

namespace {

// Array memory of this process can be refused, and looked at once more when it is given back.
bool array_memory_is_refused = false;
const void* watched = nullptr;
size_t watched_size = 0;
std::vector<uint8_t>* seen_at_release = nullptr;

void look_once_more(void* memory) {
  if (memory == nullptr || memory != watched) return;
  const auto* bytes = static_cast<const uint8_t*>(memory);
  seen_at_release->assign(bytes, bytes + watched_size);
  watched = nullptr;
}

}  // namespace

void* operator new[](size_t size, const std::nothrow_t&) noexcept {
  return array_memory_is_refused ? nullptr : std::malloc(size);
}

void* operator new[](size_t size) {
  void* memory = std::malloc(size);
  if (memory == nullptr) throw std::bad_alloc();
  return memory;
}

void operator delete[](void* memory) noexcept {
  look_once_more(memory);
  std::free(memory);
}

void operator delete[](void* memory, size_t) noexcept { operator delete[](memory); }
void operator delete[](void* memory, const std::nothrow_t&) noexcept { operator delete[](memory); }

namespace {

// Type 0x04030201, version -2, a value of 5 bytes.
std::vector<uint8_t> a_key() {
  return {0x01, 0x02, 0x03, 0x04, 0xFE, 0xFF, 0xFF, 0xFF, 0x05, 0x00, 0x00, 0x00, 'a', 'b', 'c', 'd', 'e'};
}

// A key with `value_length` bytes of 0x5A.
std::vector<uint8_t> key_with_value_of(size_t value_length) {
  std::vector<uint8_t> bytes = {7, 0, 0, 0, 1, 0, 0, 0, static_cast<uint8_t>(value_length), 0, 0, 0};
  bytes.resize(12 + value_length, 0x5A);
  return bytes;
}

sec_buffer buffer_of(const std::vector<uint8_t>& bytes) { return {static_cast<int32_t>(bytes.size()), bytes.data()}; }

sec_key_desc filled_with_garbage() {
  sec_key_desc key;
  std::memset(&key, 0xA5, sizeof key);
  return key;
}

void expect_all_zero(const sec_key_desc& key) {
  EXPECT_EQ(key.type, 0U);
  EXPECT_EQ(key.version, 0);
  EXPECT_EQ(key.length, 0);
  EXPECT_EQ(key.value, nullptr);
  EXPECT_EQ(key.schedule, nullptr);
}

void expect_refused(const std::vector<uint8_t>& bytes) {
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key = filled_with_garbage();
  EXPECT_EQ(sec_unmarshal_typed_key(&buffer, &key), -1);
  expect_all_zero(key);
}

std::vector<uint8_t> value_of(const sec_key_desc& key) {
  const auto* bytes = static_cast<const uint8_t*>(key.value);
  return {bytes, bytes + key.length};
}

TEST(TypedKey, FieldsAreReadLittleEndian) {
  const std::vector<uint8_t> bytes = a_key();
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key = filled_with_garbage();
  ASSERT_EQ(sec_unmarshal_typed_key(&buffer, &key), 0);
  EXPECT_EQ(key.type, 0x04030201U);
  EXPECT_EQ(key.version, -2);
  EXPECT_EQ(key.length, 5);
  EXPECT_THAT(value_of(key), ElementsAre('a', 'b', 'c', 'd', 'e'));
  EXPECT_EQ(key.schedule, nullptr);
  sec_release_typed_key(&key);
}

TEST(TypedKey, ValueIsInMemoryOfItsOwn) {
  std::vector<uint8_t> bytes = a_key();
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key{};
  ASSERT_EQ(sec_unmarshal_typed_key(&buffer, &key), 0);
  bytes.assign(bytes.size(), 0);
  EXPECT_THAT(value_of(key), ElementsAre('a', 'b', 'c', 'd', 'e'));
  sec_release_typed_key(&key);
}

TEST(TypedKey, LargestKeyIs256Bytes) {
  const std::vector<uint8_t> bytes = key_with_value_of(244);
  ASSERT_THAT(bytes, SizeIs(256));
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key{};
  ASSERT_EQ(sec_unmarshal_typed_key(&buffer, &key), 0);
  EXPECT_EQ(key.length, 244);
  EXPECT_THAT(value_of(key), Each(0x5A));
  sec_release_typed_key(&key);
  expect_refused(key_with_value_of(245));
}

TEST(TypedKey, ValueMayBeEmpty) {
  const std::vector<uint8_t> bytes = key_with_value_of(0);
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key = filled_with_garbage();
  EXPECT_EQ(sec_unmarshal_typed_key(&buffer, &key), 0);
  EXPECT_EQ(key.type, 7U);
  EXPECT_EQ(key.version, 1);
  EXPECT_EQ(key.length, 0);
  EXPECT_EQ(key.value, nullptr);
  EXPECT_EQ(key.schedule, nullptr);
}

TEST(TypedKey, HeaderCutShortIsRefused) {
  for (size_t length = 0; length < 12; ++length) {
    std::vector<uint8_t> bytes = key_with_value_of(0);
    bytes.resize(length);
    expect_refused(bytes);
  }
}

TEST(TypedKey, ValueCutShortIsRefused) {
  std::vector<uint8_t> bytes = a_key();
  bytes.pop_back();
  expect_refused(bytes);
}

TEST(TypedKey, BytesBehindTheValueAreRefused) {
  std::vector<uint8_t> bytes = a_key();
  bytes.push_back(0);
  expect_refused(bytes);
}

TEST(TypedKey, NegativeValueLengthIsRefused) {
  std::vector<uint8_t> bytes = a_key();
  std::fill(bytes.begin() + 8, bytes.begin() + 12, uint8_t{0xFF});
  expect_refused(bytes);
}

TEST(TypedKey, ValueLengthWithAHighByteIsRefused) {
  std::vector<uint8_t> bytes = a_key();
  bytes[11] = 0x01;
  expect_refused(bytes);
}

TEST(TypedKey, NegativeBufferLengthIsRefused) {
  const std::vector<uint8_t> bytes = a_key();
  const sec_buffer buffer{-1, bytes.data()};
  sec_key_desc key = filled_with_garbage();
  EXPECT_EQ(sec_unmarshal_typed_key(&buffer, &key), -1);
  expect_all_zero(key);
}

TEST(TypedKey, MissingBytesAreRefused) {
  const sec_buffer buffer{17, nullptr};
  sec_key_desc key = filled_with_garbage();
  EXPECT_EQ(sec_unmarshal_typed_key(&buffer, &key), -1);
  expect_all_zero(key);
}

TEST(TypedKey, MissingArgumentsAreRefused) {
  const std::vector<uint8_t> bytes = a_key();
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key = filled_with_garbage();
  EXPECT_EQ(sec_unmarshal_typed_key(nullptr, &key), -1);
  expect_all_zero(key);
  EXPECT_EQ(sec_unmarshal_typed_key(&buffer, nullptr), -1);
}

TEST(TypedKey, WithoutMemoryItIsRefused) {
  const std::vector<uint8_t> bytes = a_key();
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key = filled_with_garbage();
  array_memory_is_refused = true;
  const int result = sec_unmarshal_typed_key(&buffer, &key);
  array_memory_is_refused = false;
  EXPECT_EQ(result, -1);
  expect_all_zero(key);
}

TEST(ReleasedKey, IsWipedBeforeItsMemoryIsGivenBack) {
  const std::vector<uint8_t> bytes = a_key();
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key{};
  ASSERT_EQ(sec_unmarshal_typed_key(&buffer, &key), 0);
  std::vector<uint8_t> seen;
  seen_at_release = &seen;
  watched_size = 5;
  watched = key.value;
  sec_release_typed_key(&key);
  EXPECT_THAT(seen, ElementsAre(0, 0, 0, 0, 0));
}

TEST(ReleasedKey, IsAllZero) {
  const std::vector<uint8_t> bytes = a_key();
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key{};
  ASSERT_EQ(sec_unmarshal_typed_key(&buffer, &key), 0);
  sec_release_typed_key(&key);
  expect_all_zero(key);
}

TEST(ReleasedKey, MayBeReleasedAgain) {
  const std::vector<uint8_t> bytes = a_key();
  const sec_buffer buffer = buffer_of(bytes);
  sec_key_desc key{};
  ASSERT_EQ(sec_unmarshal_typed_key(&buffer, &key), 0);
  sec_release_typed_key(&key);
  sec_release_typed_key(&key);
  expect_all_zero(key);
}

TEST(ReleasedKey, RecordThatHoldsNothingIsLeftAlone) {
  sec_key_desc key{};
  sec_release_typed_key(&key);
  expect_all_zero(key);
  sec_release_typed_key(nullptr);
}

}  // namespace
