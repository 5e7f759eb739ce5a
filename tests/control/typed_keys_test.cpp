// Keys as a program gets them from the shared library and the security library of this platform.
#include <gtest/gtest.h>

#include <cstring>

#include "hb_client.h"
#include "support/fake_daemon.h"

namespace hb_test {
namespace {

class TypedKeys : public testing::Test {
 protected:
  TypedKeys() {
    daemon.serve_configuration(configuration_answer(small_cluster()));
    EXPECT_EQ(Hb_Success, hb_init());
    connection = daemon.take_connection();
  }
  ~TypedKeys() override { hb_terminate(); }

  // Type 3, version 2, as many bytes of value as are claimed or not.
  static Bytes stored_key(uint32_t claimed, const Bytes& value) {
    const Bytes key = ByteBuilder().u32(3).u32(2).u32(claimed).raw(value).bytes();
    return ByteBuilder().u32(static_cast<uint32_t>(key.size())).raw(key).bytes();
  }

  void publish_current(const Bytes& key) { daemon.write_segment(Segment::security, 284 + 20, key); }
  void publish_cached(size_t entry, const Bytes& key) {
    daemon.write_segment(Segment::security, 564 + entry * 260, key);
  }

  Hb_Rc read() { return hb_get_security_infomation(&current, &previous, &cache); }
  Hb_Rc free() { return hb_free_security_info_keys(&current, &previous, &cache); }

  static bool is_empty(const sec_key_desc& key) {
    return key.type == 0 && key.version == 0 && key.length == 0 && key.value == nullptr && key.schedule == nullptr;
  }

  FakeDaemon daemon;
  DaemonConnection connection;
  Hb_Security_Status current = {};
  Hb_Security_Status previous = {};
  Hb_Key_Cache cache = {};
};

TEST_F(TypedKeys, AreUnmarshalledAndGivenBack) {
  publish_current(stored_key(6, "secret"));
  publish_cached(9, stored_key(244, Bytes(244, 'k')));
  ASSERT_EQ(Hb_Success, read());
  EXPECT_EQ(3U, current.key.type);
  EXPECT_EQ(2, current.key.version);
  ASSERT_EQ(6, current.key.length);
  EXPECT_EQ(0, std::memcmp(current.key.value, "secret", 6));
  ASSERT_EQ(244, cache.keyCache[9].length);
  EXPECT_TRUE(is_empty(previous.key));
  EXPECT_EQ(Hb_Success, free());
  EXPECT_TRUE(is_empty(current.key));
  EXPECT_TRUE(is_empty(cache.keyCache[9]));
  EXPECT_EQ(Hb_Success, free());
}

TEST_F(TypedKeys, AreMemoryOfTheirOwn) {
  publish_current(stored_key(6, "secret"));
  ASSERT_EQ(Hb_Success, read());
  publish_current(stored_key(6, "hidden"));
  EXPECT_EQ(0, std::memcmp(current.key.value, "secret", 6));
  EXPECT_EQ(Hb_Success, free());
}

TEST_F(TypedKeys, ThatAreMalformedEndTheReading) {
  publish_current(stored_key(6, "secret"));
  publish_cached(2, stored_key(7, "secret"));
  publish_cached(3, stored_key(6, "secret"));
  EXPECT_EQ(Hb_Failure, read());
  EXPECT_EQ(6, current.key.length);
  EXPECT_TRUE(is_empty(cache.keyCache[2]));
  EXPECT_TRUE(is_empty(cache.keyCache[3]));
  EXPECT_EQ(Hb_Success, free());
}

}  // namespace
}  // namespace hb_test
