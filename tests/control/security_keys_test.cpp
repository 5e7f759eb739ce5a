// Security keys: what is handed to the security library, what the caller gets, and what is released when.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/sem.h>

#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

#include "hb_communication/shared_memory.h"
#include "reader_lock.h"
#include "steering.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::IsEmpty;
using testing::SizeIs;

using Key_Bytes = std::vector<uint8_t>;

// Where the parts of the security segment lie.
constexpr size_t previous_offset = 4;
constexpr size_t current_offset = 284;
constexpr size_t cache_offset = 564;

// A stored key of 260 bytes.
Bytes stored_key(int32_t length, const Bytes& value) { return ByteBuilder().i32(length).text(value, 256).bytes(); }
Bytes stored_key(const Bytes& value) { return stored_key(static_cast<int32_t>(value.size()), value); }
Bytes no_key() { return Bytes(260, '\0'); }

struct Outputs {
  Outputs() {
    std::memset(&current, 0xB7, sizeof current);
    std::memset(&previous, 0xB7, sizeof previous);
    std::memset(&cache, 0xB7, sizeof cache);
  }
  Hb_Security_Status current;
  Hb_Security_Status previous;
  Hb_Key_Cache cache;
};

template <typename T>
bool is_filled_with(const T& record, uint8_t byte) {
  const auto* first = reinterpret_cast<const uint8_t*>(&record);
  return std::all_of(first, first + sizeof record, [byte](uint8_t found) { return found == byte; });
}

bool is_untouched(const Outputs& out) {
  return is_filled_with(out.current, 0xB7) && is_filled_with(out.previous, 0xB7) && is_filled_with(out.cache, 0xB7);
}

class SecurityKeys : public Steering {
 protected:
  void publish(size_t offset, const Bytes& bytes) { daemon.write_segment(Segment::security, offset, bytes); }
  void publish_current(const Bytes& key) {
    publish(current_offset, ByteBuilder().u32(1).i32(11).u32(12).u32(13).u32(14).raw(key).bytes());
  }
  void publish_previous(const Bytes& key) {
    publish(previous_offset, ByteBuilder().u32(21).i32(-22).u32(23).u32(24).u32(25).raw(key).bytes());
  }
  void publish_cached(size_t entry, const Bytes& key) { publish(cache_offset + entry * 260, key); }
  void publish_cache_count(uint32_t count) { publish(cache_offset + 2600, ByteBuilder().u32(count).bytes()); }

  // Twelve keys in the order in which they are read: "current", "previous", "cached 0" to "cached 9".
  void publish_twelve_keys() {
    publish_current(stored_key("current"));
    publish_previous(stored_key("previous"));
    for (size_t entry = 0; entry < 10; ++entry) {
      publish_cached(entry, stored_key("cached " + std::to_string(entry)));
    }
    publish_cache_count(10);
  }

  // The security library unmarshals so many keys and then refuses.
  static void accept_keys(int count) {
    for (int key = 0; key < count; ++key) {
      const auto number = static_cast<uint8_t>(key);
      platform_double().unmarshal_answers.push_back({0, 100U + number, 200 + key, Key_Bytes(8, number)});
    }
  }

  Hb_Rc read() { return hb_get_security_infomation(&out.current, &out.previous, &out.cache); }
  Hb_Rc free() { return hb_free_security_info_keys(&out.current, &out.previous, &out.cache); }

  // In the order in which they are read.
  std::vector<sec_key_desc*> keys() {
    std::vector<sec_key_desc*> all = {&out.current.key, &out.previous.key};
    for (sec_key_desc& key : out.cache.keyCache) {
      all.push_back(&key);
    }
    return all;
  }

  static std::vector<sec_key_desc*> released() {
    std::vector<sec_key_desc*> records;
    for (const Recorded_Release& release : platform_double().releases) {
      records.push_back(release.key);
    }
    return records;
  }

  Outputs out;
};

// Programs are compiled against these places.
TEST(SecurityRecords, LieInTheirOrder) {
  EXPECT_EQ(0U, offsetof(sec_key_desc, type));
  EXPECT_EQ(4U, offsetof(sec_key_desc, version));
  EXPECT_EQ(8U, offsetof(sec_key_desc, length));
  EXPECT_EQ(16U, offsetof(sec_key_desc, value));
  EXPECT_EQ(24U, offsetof(sec_key_desc, schedule));
  EXPECT_EQ(0U, offsetof(Hb_Security_Status, securityOn));
  EXPECT_EQ(4U, offsetof(Hb_Security_Status, keyCount));
  EXPECT_EQ(8U, offsetof(Hb_Security_Status, TRELL_compatible));
  EXPECT_EQ(12U, offsetof(Hb_Security_Status, is_valid_for_signing));
  EXPECT_EQ(16U, offsetof(Hb_Security_Status, is_valid_for_authenticating));
  EXPECT_EQ(24U, offsetof(Hb_Security_Status, key));
  EXPECT_EQ(56U, sizeof(Hb_Security_Status));
  EXPECT_EQ(0U, offsetof(Hb_Key_Cache, keyCache));
  EXPECT_EQ(320U, offsetof(Hb_Key_Cache, keyCacheCount));
  EXPECT_EQ(328U, sizeof(Hb_Key_Cache));
}

TEST_F(SecurityKeys, HaveASequenceNumber) {
  publish(0, ByteBuilder().u32(0xFEDCBA98).bytes());
  Hb_Sequence_Number sequence = 0;
  EXPECT_TRUE(succeeds([&] { return hb_get_security_sequence(&sequence); }));
  EXPECT_EQ(0xFEDCBA98U, sequence);
  publish(0, ByteBuilder().u32(0).bytes());
  EXPECT_TRUE(succeeds([&] { return hb_get_security_sequence(&sequence); }));
  EXPECT_EQ(0U, sequence);
  EXPECT_TRUE(nothing_sent());
}

TEST_F(SecurityKeys, NeedPlaces) {
  EXPECT_TRUE(fails_with(4, [] { return hb_get_security_sequence(nullptr); }));
  EXPECT_TRUE(fails_with(4, [this] { return hb_get_security_infomation(nullptr, &out.previous, &out.cache); }));
  EXPECT_TRUE(fails_with(4, [this] { return hb_get_security_infomation(&out.current, nullptr, &out.cache); }));
  EXPECT_TRUE(fails_with(4, [this] { return hb_get_security_infomation(&out.current, &out.previous, nullptr); }));
  EXPECT_TRUE(is_untouched(out));
}

TEST_F(SecurityKeys, ThatAreNotPublishedFailWithoutAnErrorNumber) {
  hb_detach_shared_memory();
  Hb_Sequence_Number sequence = 77;
  EXPECT_TRUE(fails_without_error_number([&] { return hb_get_security_sequence(&sequence); }));
  EXPECT_TRUE(fails_without_error_number([this] { return read(); }));
  EXPECT_EQ(77U, sequence);
  EXPECT_TRUE(is_untouched(out));
  EXPECT_THAT(platform_double().unmarshals, IsEmpty());
  EXPECT_THAT(platform_double().releases, IsEmpty());
}

TEST_F(SecurityKeys, OfLengthZeroAreZero) {
  publish_current(stored_key(0, "leftover"));
  publish_previous(no_key());
  publish_cached(5, stored_key(0, "leftover"));
  EXPECT_TRUE(succeeds([this] { return read(); }));
  for (const sec_key_desc* key : keys()) {
    EXPECT_TRUE(is_filled_with(*key, 0));
  }
  EXPECT_THAT(platform_double().unmarshals, IsEmpty());
  EXPECT_THAT(platform_double().releases, IsEmpty());
  EXPECT_TRUE(nothing_sent());
}

TEST_F(SecurityKeys, ComeWithTheFiveFieldsOfTheirStatus) {
  publish_current(no_key());
  publish_previous(no_key());
  EXPECT_TRUE(succeeds([this] { return read(); }));
  EXPECT_EQ(1, out.current.securityOn);
  EXPECT_EQ(11, out.current.keyCount);
  EXPECT_EQ(12, out.current.TRELL_compatible);
  EXPECT_EQ(13, out.current.is_valid_for_signing);
  EXPECT_EQ(14, out.current.is_valid_for_authenticating);
  EXPECT_EQ(21, out.previous.securityOn);
  EXPECT_EQ(-22, out.previous.keyCount);
  EXPECT_EQ(23, out.previous.TRELL_compatible);
  EXPECT_EQ(24, out.previous.is_valid_for_signing);
  EXPECT_EQ(25, out.previous.is_valid_for_authenticating);
}

TEST_F(SecurityKeys, ComeWithTheCountOfTheCacheAsItIs) {
  for (const uint32_t count : {0U, 3U, 10U, 11U, 0xFFFFFFFFU}) {
    publish_cache_count(count);
    EXPECT_TRUE(succeeds([this] { return read(); }));
    EXPECT_EQ(count, out.cache.keyCacheCount);
  }
}

TEST_F(SecurityKeys, AreUnmarshalledInOrderIntoTheCallersRecords) {
  publish_twelve_keys();
  accept_keys(12);
  EXPECT_TRUE(succeeds([this] { return read(); }));
  ASSERT_THAT(platform_double().unmarshals, SizeIs(12));
  const std::vector<sec_key_desc*> records = keys();
  for (size_t i = 0; i < 12; ++i) {
    const Recorded_Unmarshal& unmarshal = platform_double().unmarshals[i];
    const Bytes expected = i == 0 ? "current" : i == 1 ? "previous" : "cached " + std::to_string(i - 2);
    EXPECT_EQ(expected, Bytes(unmarshal.bytes.begin(), unmarshal.bytes.end()));
    EXPECT_EQ(static_cast<int32_t>(expected.size()), unmarshal.length);
    EXPECT_EQ(records[i], unmarshal.key);
    EXPECT_EQ(100 + i, records[i]->type);
    EXPECT_EQ(200 + static_cast<int>(i), records[i]->version);
    EXPECT_EQ(8, records[i]->length);
    EXPECT_EQ(Bytes(8, static_cast<char>(i)), Bytes(static_cast<const char*>(records[i]->value), 8));
  }
  EXPECT_EQ(10U, out.cache.keyCacheCount);
  EXPECT_THAT(platform_double().releases, IsEmpty());
  EXPECT_TRUE(succeeds([this] { return free(); }));
}

TEST_F(SecurityKeys, MayBeOf1To256Bytes) {
  Bytes whole;
  for (int byte = 0; byte < 256; ++byte) {
    whole.push_back(static_cast<char>(byte));
  }
  publish_current(stored_key(whole));
  publish_cached(9, stored_key("k"));
  publish_cache_count(0xFFFFFFFFU);
  accept_keys(2);
  EXPECT_TRUE(succeeds([this] { return read(); }));
  ASSERT_THAT(platform_double().unmarshals, SizeIs(2));
  EXPECT_EQ(Key_Bytes(whole.begin(), whole.end()), platform_double().unmarshals[0].bytes);
  EXPECT_EQ(Key_Bytes{'k'}, platform_double().unmarshals[1].bytes);
  EXPECT_EQ(&out.cache.keyCache[9], platform_double().unmarshals[1].key);
  EXPECT_TRUE(is_filled_with(out.previous.key, 0));
  EXPECT_TRUE(is_filled_with(out.cache.keyCache[8], 0));
  EXPECT_TRUE(succeeds([this] { return free(); }));
}

// Keys that cannot be unmarshalled: twelve places, one after the other.

class RefusedKey : public SecurityKeys, public testing::WithParamInterface<int> {
 protected:
  size_t place() const { return static_cast<size_t>(GetParam()); }

  void publish_at_place(const Bytes& key) {
    if (place() == 0) {
      publish_current(key);
    } else if (place() == 1) {
      publish_previous(key);
    } else {
      publish_cached(place() - 2, key);
    }
  }

  // The keys before that place are the caller's, it is released, and behind it nothing was looked at.
  void expect_stopped_at_place() {
    const std::vector<sec_key_desc*> records = keys();
    for (size_t i = 0; i < place(); ++i) {
      EXPECT_EQ(100 + i, records[i]->type);
      EXPECT_NE(nullptr, records[i]->value);
    }
    EXPECT_TRUE(is_filled_with(*records[place()], 0));
    for (size_t i = place() + 1; i < 12; ++i) {
      EXPECT_TRUE(is_filled_with(*records[i], 0xB7));
    }
    EXPECT_EQ(std::vector<sec_key_desc*>{records[place()]}, released());
    EXPECT_EQ(0xB7B7B7B7U, out.cache.keyCacheCount);
  }

  // Each key that the caller got is released once, and the refused one not again.
  void expect_freed_once() {
    platform_double().releases.clear();
    const std::vector<sec_key_desc*> records = keys();
    for (size_t i = place() + 1; i < 12; ++i) {
      *records[i] = {};  // as a caller does beforehand
    }
    EXPECT_TRUE(succeeds([this] { return free(); }));
    EXPECT_EQ(std::vector<sec_key_desc*>(records.begin(), records.begin() + GetParam()), released());
    EXPECT_TRUE(succeeds([this] { return free(); }));
    EXPECT_EQ(place(), released().size());
  }
};

TEST_P(RefusedKey, EndsTheReadingAndIsReleased) {
  publish_twelve_keys();
  accept_keys(GetParam());
  EXPECT_TRUE(fails_without_error_number([this] { return read(); }));
  EXPECT_EQ(place() + 1, platform_double().unmarshals.size());
  expect_stopped_at_place();
  expect_freed_once();
}

TEST_P(RefusedKey, LeavesTheFieldsOfItsStatus) {
  publish_twelve_keys();
  accept_keys(GetParam());
  EXPECT_EQ(Hb_Failure, read());
  EXPECT_EQ(1, out.current.securityOn);
  EXPECT_EQ(11, out.current.keyCount);
  EXPECT_EQ(14, out.current.is_valid_for_authenticating);
  if (place() > 0) {
    EXPECT_EQ(21, out.previous.securityOn);
    EXPECT_EQ(-22, out.previous.keyCount);
    EXPECT_EQ(25, out.previous.is_valid_for_authenticating);
  } else {
    EXPECT_TRUE(is_filled_with(out.previous, 0xB7));
  }
  expect_freed_once();
}

TEST_P(RefusedKey, IsOneOfAnImpossibleLengthToo) {
  for (const int32_t length : {-1, 257, 2147483647, -2147483647 - 1}) {
    out = Outputs();
    platform_double().reset();
    publish_twelve_keys();
    publish_at_place(stored_key(length, "key"));
    accept_keys(12);
    EXPECT_TRUE(fails_without_error_number([this] { return read(); })) << length;
    EXPECT_EQ(place(), platform_double().unmarshals.size());  // it was not even handed over
    expect_stopped_at_place();
    expect_freed_once();
  }
}

INSTANTIATE_TEST_SUITE_P(Places, RefusedKey, testing::Range(0, 12));

TEST_F(SecurityKeys, OfAnyOtherRefusalAreRefusedToo) {
  publish_current(stored_key("current"));
  platform_double().unmarshal_answers.push_back({1, 0, 0, {}});
  EXPECT_TRUE(fails_without_error_number([this] { return read(); }));
  EXPECT_EQ(std::vector<sec_key_desc*>{&out.current.key}, released());
}

// Giving keys back.

TEST_F(SecurityKeys, AreGivenBackOnce) {
  publish_twelve_keys();
  accept_keys(12);
  ASSERT_EQ(Hb_Success, read());
  EXPECT_TRUE(succeeds([this] { return free(); }));
  EXPECT_EQ(keys(), released());
  EXPECT_TRUE(succeeds([this] { return free(); }));
  EXPECT_THAT(released(), SizeIs(12));
}

TEST_F(SecurityKeys, AreGivenBackFromEachRecordOnItsOwn) {
  publish_twelve_keys();
  accept_keys(12);
  ASSERT_EQ(Hb_Success, read());
  const std::vector<sec_key_desc*> records = keys();
  EXPECT_TRUE(succeeds([this] { return hb_free_security_info_keys(&out.current, nullptr, nullptr); }));
  EXPECT_EQ(std::vector<sec_key_desc*>{records[0]}, released());
  EXPECT_TRUE(succeeds([this] { return hb_free_security_info_keys(nullptr, &out.previous, nullptr); }));
  EXPECT_EQ((std::vector<sec_key_desc*>{records[0], records[1]}), released());
  EXPECT_TRUE(succeeds([this] { return hb_free_security_info_keys(nullptr, nullptr, &out.cache); }));
  EXPECT_EQ(records, released());
  EXPECT_TRUE(succeeds([] { return hb_free_security_info_keys(nullptr, nullptr, nullptr); }));
}

TEST_F(SecurityKeys, WithoutALengthOrAValueAreNotReleased) {
  std::memset(&out.current, 0, sizeof out.current);
  std::memset(&out.previous, 0, sizeof out.previous);
  std::memset(&out.cache, 0, sizeof out.cache);
  char value = 'v';
  out.current.key.value = &value;
  out.previous.key.length = 8;
  out.cache.keyCache[0].value = &value;
  out.cache.keyCache[9].length = 8;
  EXPECT_TRUE(succeeds([this] { return free(); }));
  EXPECT_THAT(released(), IsEmpty());
  EXPECT_EQ(&value, out.current.key.value);
  EXPECT_EQ(8, out.previous.key.length);
}

TEST_F(SecurityKeys, AreGivenBackFromTheWholeCacheWhateverItsCount) {
  publish_cached(9, stored_key("cached"));
  publish_cache_count(0);
  accept_keys(1);
  ASSERT_EQ(Hb_Success, read());
  EXPECT_TRUE(succeeds([this] { return free(); }));
  EXPECT_EQ(std::vector<sec_key_desc*>{&out.cache.keyCache[9]}, released());
}

TEST_F(SecurityKeys, AreGivenBackAlsoAfterTheStop) {
  publish_twelve_keys();
  accept_keys(12);
  ASSERT_EQ(Hb_Success, read());
  ASSERT_EQ(Hb_Success, hb_terminate());
  daemon.stop_listening();
  EXPECT_TRUE(succeeds([this] { return free(); }));
  EXPECT_THAT(released(), SizeIs(12));
  EXPECT_EQ(Hb_False, client_initialized);
}

TEST_F(SecurityKeys, AreReadWithoutTheReaderLock) {
  const Reader_Lock lock(daemon.semaphore_id());
  lock.set_writer(1);
  publish_twelve_keys();
  accept_keys(12);
  Hb_Sequence_Number sequence = 77;
  SystemCalls calls;
  EXPECT_TRUE(succeeds([&] { return hb_get_security_sequence(&sequence); }));
  EXPECT_TRUE(succeeds([this] { return read(); }));
  EXPECT_TRUE(calls.of("semop").empty());
  EXPECT_EQ(0, lock.readers());
  EXPECT_TRUE(succeeds([this] { return free(); }));
}

TEST_F(SecurityKeys, OfTheSegmentStayAsTheyAre) {
  publish_twelve_keys();
  accept_keys(12);
  const Bytes before = daemon.read_segment(Segment::security);
  ASSERT_EQ(Hb_Success, read());
  EXPECT_TRUE(succeeds([this] { return free(); }));
  EXPECT_TRUE(before == daemon.read_segment(Segment::security));
}

}  // namespace
}  // namespace hb_test
