// hbctl security: what is published about the keys, and their bytes only when they are to be revealed.
#include <gmock/gmock.h>

#include "steered.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::Not;

// A stored key of 260 bytes: its length, then type, version, length and value.
Bytes stored_key(uint32_t type, int32_t version, const Bytes& value) {
  const auto length = static_cast<int32_t>(value.size());
  const Bytes key = ByteBuilder().u32(type).i32(version).i32(length).raw(value).bytes();
  return ByteBuilder().i32(length + 12).text(key, 256).bytes();
}

class HbctlSecurity : public Steered {
 protected:
  // Number 9; a current key "secret" that signs and authenticates, a previous one "before" that authenticates, and one
  // in the cache.
  void publish_three_keys() {
    publish(0, ByteBuilder().u32(9).bytes());
    publish(284, ByteBuilder().u32(1).i32(3).u32(0).u32(1).u32(1).raw(stored_key(1, 12, "secret")).bytes());
    publish(4, ByteBuilder().u32(1).i32(3).u32(1).u32(0).u32(1).raw(stored_key(1, 11, "before")).bytes());
    publish(564, stored_key(1, 10, "older"));
    publish(564 + 2600, ByteBuilder().u32(1).bytes());
  }

  void publish(size_t offset, const Bytes& bytes) { daemon().daemon().write_segment(Segment::security, offset, bytes); }

  // Neither as they are nor in hexadecimal.
  static void expect_no_key_bytes(const Finished& finished) {
    for (const char* bytes : {"secret", "736563726574", "before", "6265666f7265", "older", "6f6c646572"}) {
      EXPECT_THAT(finished.output, Not(HasSubstr(bytes)));
      EXPECT_THAT(finished.errors, Not(HasSubstr(bytes)));
    }
  }
};

TEST_F(HbctlSecurity, is_a_table_of_keys_without_their_bytes) {
  publish_three_keys();
  const Finished finished = run_without_request({"security"});
  EXPECT_EQ(finished.output,
            "Security  on\n"
            "Sequence  9\n"
            "KEY       TYPE  VERSION  LENGTH  SIGNING  AUTHENTICATING\n"
            "current      1       12       6  yes      yes\n"
            "previous     1       11       6  no       yes\n"
            "cached 0     1       10       5  -        -\n");
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
  expect_no_key_bytes(finished);
}

TEST_F(HbctlSecurity, is_in_json_without_their_bytes) {
  publish_three_keys();
  const Finished finished = run_without_request({"security", "--json"});
  const json expected = {
      {"version", 1},
      {"type", "security"},
      {"sequence", 9},
      {"current",
       {{"security_on", true},
        {"key_count", 3},
        {"trell_compatible", false},
        {"signing", true},
        {"authenticating", true},
        {"key", {{"type", 1}, {"key_version", 12}, {"length", 6}}}}},
      {"previous",
       {{"security_on", true},
        {"key_count", 3},
        {"trell_compatible", true},
        {"signing", false},
        {"authenticating", true},
        {"key", {{"type", 1}, {"key_version", 11}, {"length", 6}}}}},
      {"cache", json::array({{{"type", 1}, {"key_version", 10}, {"length", 5}}})},
  };
  EXPECT_EQ(parse(finished), expected);
  expect_no_key_bytes(finished);
}

TEST_F(HbctlSecurity, reveals_the_bytes_when_it_is_told_to) {
  publish_three_keys();
  EXPECT_EQ(run_without_request({"security", "--reveal"}).output,
            "Security  on\n"
            "Sequence  9\n"
            "KEY       TYPE  VERSION  LENGTH  SIGNING  AUTHENTICATING  VALUE\n"
            "current      1       12       6  yes      yes             736563726574\n"
            "previous     1       11       6  no       yes             6265666f7265\n"
            "cached 0     1       10       5  -        -               6f6c646572\n");
  const json security = parse(run_without_request({"security", "--reveal", "--json"}));
  EXPECT_EQ(security["current"]["key"]["value"], "736563726574");
  EXPECT_EQ(security["previous"]["key"]["value"], "6265666f7265");
  EXPECT_EQ(security["cache"][0]["value"], "6f6c646572");
}

TEST_F(HbctlSecurity, is_off_and_has_no_keys_when_all_is_zero) {
  EXPECT_EQ(run_without_request({"security", "--reveal"}).output,
            "Security  off\n"
            "Sequence  0\n"
            "KEY       TYPE  VERSION  LENGTH  SIGNING  AUTHENTICATING  VALUE\n"
            "current      -        -    none  no       no              -\n"
            "previous     -        -    none  no       no              -\n");
  const json security = parse(run_without_request({"security", "--json"}));
  EXPECT_EQ(security["current"]["key"], nullptr);
  EXPECT_EQ(security["cache"], json::array());
}

TEST_F(HbctlSecurity, has_no_more_cached_keys_than_there_is_room_for) {
  publish(564 + 2600, ByteBuilder().u32(0xFFFFFFFF).bytes());
  EXPECT_EQ(parse(run_without_request({"security", "--json"}))["cache"].size(), 10U);
}

TEST_F(HbctlSecurity, fails_without_a_number_when_a_key_is_malformed) {
  publish_three_keys();
  publish(284 + 20, ByteBuilder().i32(257).bytes());
  const Finished finished = run_without_request({"security", "--reveal", "--json"});
  EXPECT_THAT(finished.errors, HasSubstr("hbctl: cannot read the security keys: one of them is malformed"));
  EXPECT_EQ(finished.status, 1);
  const json error = parse(finished)["error"];
  EXPECT_EQ(error["name"], nullptr);
  EXPECT_EQ(error["number"], nullptr);
  expect_no_key_bytes(finished);
}

}  // namespace
}  // namespace hb_test
