// Addresses as text, for both address types.
#include "hb_global_data/address_text.h"

#include <arpa/inet.h>
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "support/bytes.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

struct Of_The_Library {
  using Address = Hb_IP_address6;
  static char* text(Address* address, char* out) { return mowllib_ntop(address, out); }
};

struct Of_The_Platform {
  using Address = zu_vex_IP_address6_t;
  static char* text(Address* address, char* out) { return VEX_ntop(address, out); }
};

template <typename Family>
class AddressText : public testing::Test {
 protected:
  // The text of 16 bytes, written into exactly 46.
  std::string text(const Bytes& bytes) {
    typename Family::Address address;
    static_assert(sizeof address == 16);
    std::memcpy(&address, bytes.data(), sizeof address);
    char out[46];
    std::memset(out, '?', sizeof out);
    EXPECT_EQ(Family::text(&address, out), out);
    return out;
  }

  std::string text_of(const std::string& address) { return text(address_bytes(address)); }
};

using Families = testing::Types<Of_The_Library, Of_The_Platform>;
TYPED_TEST_SUITE(AddressText, Families);

TYPED_TEST(AddressText, OfAnIpv4MappedAddressIsDotted) {
  EXPECT_EQ(this->text(ByteBuilder().zeros(10).u8(0xff).u8(0xff).u8(10).u8(1).u8(2).u8(3).bytes()), "10.1.2.3");
  EXPECT_EQ(this->text_of("255.255.255.255"), "255.255.255.255");
  EXPECT_EQ(this->text_of("0.0.0.0"), "0.0.0.0");
}

TYPED_TEST(AddressText, OfTheIpv6LoopbackIsIpv6Text) {
  EXPECT_EQ(this->text(ByteBuilder().zeros(15).u8(1).bytes()), "::1");
}

TYPED_TEST(AddressText, OfTheAllZeroAddressIsTheUnspecifiedIpv6Address) {
  EXPECT_EQ(this->text(ByteBuilder().zeros(16).bytes()), "::");
}

TYPED_TEST(AddressText, OfAnIpv4CompatibleAddressIsIpv6Text) {
  EXPECT_EQ(this->text(ByteBuilder().zeros(12).u8(10).u8(1).u8(2).u8(3).bytes()), "::10.1.2.3");
}

TYPED_TEST(AddressText, OfTheLongestAddressFits) {
  EXPECT_EQ(this->text_of("fe80:1111:2222:3333:4444:5555:6666:7777"), "fe80:1111:2222:3333:4444:5555:6666:7777");
}

TYPED_TEST(AddressText, NeedsAllThreeFrontWordsToBeMapped) {
  EXPECT_EQ(this->text_of("1::ffff:10.1.2.3"), "1::ffff:a01:203");
  EXPECT_EQ(this->text_of("0:0:1:0:2:ffff:10.1.2.3"), "::1:0:2:ffff:a01:203");
  EXPECT_EQ(this->text_of("::1:ffff:10.1.2.3"), "::1:ffff:a01:203");
  EXPECT_EQ(this->text_of("::fffe:10.1.2.3"), "::fffe:a01:203");
}

TYPED_TEST(AddressText, AsksForTheSizesOfBothFamilies) {
  SystemCalls calls;
  this->text_of("10.1.2.3");
  this->text_of("::1");
  ASSERT_EQ(calls.of("inet_ntop").size(), 2U);
  EXPECT_EQ(calls.of("inet_ntop")[0].arguments[0], AF_INET);
  EXPECT_EQ(calls.of("inet_ntop")[0].arguments[3], 16);
  EXPECT_EQ(calls.of("inet_ntop")[1].arguments[0], AF_INET6);
  EXPECT_EQ(calls.of("inet_ntop")[1].arguments[3], 46);
}

TYPED_TEST(AddressText, OfAnAddressThatCannotBeFormattedSaysSo) {
  SystemCalls calls;
  calls.always("inet_ntop", result(0));
  EXPECT_EQ(this->text_of("10.1.2.3"), "bad address 4");
  EXPECT_EQ(this->text_of("::1"), "bad address 6");
}

}  // namespace
}  // namespace hb_test
