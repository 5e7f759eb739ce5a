/* Keys as they grow older. */
#include "key_ring.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "failure.h"
#include "support/temporary_directory.h"

namespace {

class Ring : public testing::Test {
 protected:
  void write_key(const std::string& text) { EXPECT_EQ(chmod(directory_.write("key", text).c_str(), 0600), 0); }

  static std::string value(const Hb_sec_buffer_desc& key) {
    return {key.value + 12, key.value + std::max(key.length, 12)};
  }

  TemporaryDirectory directory_;
};

TEST_F(Ring, keeps_ten_older_keys_and_forgets_the_oldest) {
  write_key("a");
  hbd::KeyRing ring(directory_.path("key"));
  for (char key = 'b'; key <= 'm'; ++key) {
    write_key(std::string(1, key));
    EXPECT_TRUE(ring.rotate());
  }
  /* Of the 13 keys a to m, m is current, l is the one before, and k to b are the ten older ones. */
  const security_information& keys = ring.published();
  EXPECT_EQ(keys.sequence_number, 13U);
  EXPECT_EQ(value(keys.current_sec_status.key), "m");
  EXPECT_EQ(value(keys.previous_sec_status.key), "l");
  EXPECT_EQ(keys.cache.keyCacheCount, 10U);
  std::string older;
  for (const auto& key : keys.cache.keyCache) {
    older += value(key);
  }
  EXPECT_EQ(older, "kjihgfedcb");
}

TEST_F(Ring, counts_cached_keys_up_to_ten) {
  hbd::KeyRing ring("");
  for (std::uint32_t expected : {0U, 1U, 2U}) {
    EXPECT_TRUE(ring.rotate());
    EXPECT_EQ(ring.published().cache.keyCacheCount, expected);
  }
}

TEST_F(Ring, takes_a_key_that_begins_like_the_current_one_for_another) {
  write_key("key");
  hbd::KeyRing ring(directory_.path("key"));
  EXPECT_FALSE(ring.rotate());
  write_key("keys");
  EXPECT_TRUE(ring.rotate());
  write_key("kez");
  EXPECT_TRUE(ring.rotate());
}

TEST_F(Ring, says_which_key_may_sign) {
  hbd::KeyRing ring("");
  EXPECT_FALSE(ring.published().previous_sec_status.is_valid_for_authenticating);
  ring.rotate();
  const auto& keys = ring.published();
  EXPECT_TRUE(keys.current_sec_status.is_valid_for_signing);
  EXPECT_FALSE(keys.previous_sec_status.is_valid_for_signing);
  EXPECT_TRUE(keys.previous_sec_status.is_valid_for_authenticating);
}

TEST_F(Ring, has_no_start_without_a_key) { EXPECT_THROW(hbd::KeyRing(directory_.path("missing")), hbd::Failure); }

}  // namespace
