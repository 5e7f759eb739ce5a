/* The request parser on its own, as it is fed with any bytes. */
#include "request_parser.h"

#include <gtest/gtest.h>

#include <random>

#include "wire.h"

namespace {

using hbd::parse_request;

/* A request without the length in front. */
Bytes packet(std::uint32_t code, const Bytes& data) {
  const Bytes framed = request(code, data);
  return {framed.begin() + 4, framed.end()};
}

template <typename Kind>
Kind parsed(const Bytes& bytes) {
  const auto result = parse_request(bytes);
  const auto* wanted = std::get_if<Kind>(&result);
  if (wanted == nullptr) {
    ADD_FAILURE() << "the packet is something else";
    return {};
  }
  return *wanted;
}

TEST(RequestParser, reads_a_number_in_place_of_the_length) {
  const Bytes framed = request_with_number(206, 98351);
  const auto request = parsed<hbd::PlainRequest>({framed.begin() + 4, framed.end()});
  EXPECT_EQ(request.code, HB_ADAPTER_IS_DOWN);
  EXPECT_EQ(request.number, 98351);
}

TEST(RequestParser, reads_every_field_of_a_subscription) {
  const auto request =
      parsed<hbd::SubscribeRequest>(packet(209, subscription(SubscriptionType::Adapter, 0x107, "mine", {0x00, 0x41})));
  EXPECT_EQ(request.subscription.type, Hb_Adapter_Subscription);
  EXPECT_EQ(request.subscription.events, 0x107);
  EXPECT_STREQ(request.subscription.name.data(), "mine");
  EXPECT_TRUE(request.subscription.members.contains(9));
  EXPECT_TRUE(request.subscription.members.contains(15));
  EXPECT_FALSE(request.subscription.members.contains(8));
}

TEST(RequestParser, keeps_31_characters_of_a_name_without_terminator) {
  Bytes record = subscription(SubscriptionType::AllNodes, 1, "");
  std::fill(record.begin() + 12, record.begin() + 44, 'x');
  const auto request = parsed<hbd::SubscribeRequest>(packet(209, record));
  EXPECT_EQ(std::string(request.subscription.name.data()), std::string(31, 'x'));
}

TEST(RequestParser, ignores_what_stands_behind_the_terminator_of_a_name) {
  Bytes record = subscription(SubscriptionType::AllNodes, 1, "ab");
  record[12 + 10] = 'z';
  const auto one = parsed<hbd::SubscribeRequest>(packet(209, record));
  const auto other = parsed<hbd::UnsubscribeRequest>(packet(210, {'a', 'b', 0, 'q'}));
  EXPECT_EQ(one.subscription.name, other.name);
}

TEST(RequestParser, takes_the_highest_adapter_number_of_a_set) {
  Bytes set(12294);
  set.back() = 0x01;
  const auto request = parsed<hbd::SubscribeRequest>(packet(209, subscription(SubscriptionType::Network, 1, "n", set)));
  EXPECT_TRUE(request.subscription.members.contains(98351));
  EXPECT_FALSE(request.subscription.members.contains(98352));
}

TEST(RequestParser, reads_the_network_and_the_value_of_a_request_about_an_adapter) {
  const auto target = std::get<hbd::AdapterTarget>(
      parsed<hbd::PlainRequest>(packet(214, {0x01, 0x02, 0xFF, 0xFF, 0xC0, 0x00, 0x02, 0x07})).data);
  EXPECT_EQ(target.network, 0x0201);
  EXPECT_EQ(target.value, 0x070200C0U);
  const auto bare = std::get<hbd::AdapterTarget>(parsed<hbd::PlainRequest>(packet(207, {0xFE, 0xFF})).data);
  EXPECT_EQ(bare.network, -2);
  EXPECT_EQ(bare.value, 0U);
}

TEST(RequestParser, reads_numbers_and_names_from_the_data) {
  EXPECT_EQ(std::get<std::uint32_t>(parsed<hbd::PlainRequest>(packet(222, {0x78, 0x56, 0x34, 0x12})).data),
            0x12345678U);
  EXPECT_EQ(std::get<std::string>(parsed<hbd::PlainRequest>(packet(225, {'e', 'n', '0'})).data), "en0");
  EXPECT_EQ(std::get<std::string>(parsed<hbd::PlainRequest>(packet(226, {})).data), "");
}

TEST(RequestParser, reads_every_field_of_a_routed_message) {
  const auto message = std::get<hbd::RoutingMessage>(parsed<hbd::PlainRequest>(packet(221, ByteWriter()
                                                                                               .u32(0x0201)
                                                                                               .u32(20)
                                                                                               .u32(1)
                                                                                               .zeros(36)
                                                                                               .u32(0)
                                                                                               .u32(2)
                                                                                               .u32(0)
                                                                                               .u32(2048)
                                                                                               .u32(3)
                                                                                               .raw({7, 8, 9})
                                                                                               .bytes()))
                                                         .data);
  EXPECT_EQ(message.port, 0x0102);
  EXPECT_EQ(message.nodes, (std::vector<std::int32_t>{0, 2048}));
  EXPECT_EQ(message.bytes, (Bytes{7, 8, 9}));
}

TEST(RequestParser, refuses_packets_that_are_shorter_than_a_header) {
  const Bytes whole = packet(201, {});
  for (std::size_t size = 0; size < 76; ++size) {
    EXPECT_NE(parsed<hbd::MalformedRequest>({whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size)}).reason,
              "");
  }
}

TEST(RequestParser, refuses_packets_that_are_cut_short_anywhere) {
  const Bytes whole = packet(209, subscription(SubscriptionType::AllNodes, 1, "s"));
  for (std::size_t size = 76; size < whole.size(); size += 61) {
    EXPECT_NE(parsed<hbd::MalformedRequest>({whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size)}).reason,
              "");
  }
}

TEST(RequestParser, knows_the_codes_201_to_227_and_no_others) {
  for (std::uint32_t code = 190; code < 240; ++code) {
    const auto result = parse_request(packet(code, Bytes(1, 7)));
    const auto* malformed = std::get_if<hbd::MalformedRequest>(&result);
    const bool unknown = malformed != nullptr && malformed->reason.find("unknown") != std::string::npos;
    EXPECT_EQ(unknown, code < 201 || code > 227) << code;
  }
}

TEST(RequestParser, yields_something_for_any_bytes) {
  std::mt19937 generator(1);
  for (int i = 0; i < 20000; ++i) {
    Bytes bytes = packet(static_cast<std::uint32_t>(201 + generator() % 27), Bytes(generator() % 64));
    for (int changes = 0; changes < 3; ++changes) {
      bytes[generator() % bytes.size()] = static_cast<std::uint8_t>(generator());
    }
    EXPECT_FALSE(parse_request(bytes).valueless_by_exception());
  }
}

}  // namespace
