// Messages that the daemon routes to other nodes: what is checked, in which order, and the bytes sent.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <limits>
#include <numeric>
#include <vector>

#include "hb_communication/routes.h"
#include "steering.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

class RoutedMessage : public Steering {
 protected:
  static iovec buffer(Bytes& bytes) { return {bytes.data(), bytes.size()}; }

  Hb_Rc route(std::vector<iovec> buffers, int port = 80) {
    const auto count = static_cast<int>(buffers.size());
    buffers.push_back({nullptr, 0});  // so that there is always an array
    return hb_daemon_route_mcast(buffers.data(), count, port, nodes.data(), static_cast<int>(nodes.size()));
  }

  // A message of one buffer of that size.
  Hb_Rc route_bytes(size_t size) {
    Bytes bytes(size, 'm');
    return route({buffer(bytes)});
  }

  testing::AssertionResult is_refused_with(int error, const std::vector<iovec>& buffers) {
    return refuses(error, [&] { return route(buffers); });
  }

  // A request for port 80 in the other byte order, to those nodes, with that body.
  static Bytes expected(const std::vector<uint32_t>& destinations, const Bytes& body) {
    ByteBuilder data;
    data.raw(octets({0, 80, 0, 0})).u32(20).u32(1).zeros(36).u32(0);
    data.u32(static_cast<uint32_t>(destinations.size()));
    for (const uint32_t node : destinations) {
      data.u32(node);
    }
    return request_with(221, data.u32(static_cast<uint32_t>(body.size())).raw(body).bytes());
  }

  void count_nodes(size_t count) {
    nodes.resize(count);
    std::iota(nodes.begin(), nodes.end(), 0);
  }

  std::vector<int> nodes = {4, 0, 3};
  Bytes text = "text";
  Bytes more = "more";
};

TEST_F(RoutedMessage, IsHeaderNodesSizeAndBuffers) {
  EXPECT_TRUE(succeeds([this] { return route({buffer(text)}); }));
  EXPECT_TRUE(sent(request_with(
      221, octets({0,   80,  0,   0,                                                               // port
                   20,  0,   0,   0,                                                               // time to live
                   1,   0,   0,   0,                                                               // version
                   0,   0,   0,   0,  0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0,  // expansion
                   0,   0,   0,   0,  0, 0, 0, 0, 0, 0, 0, 0,                                      //
                   0,   0,   0,   0,                                                               // flag
                   3,   0,   0,   0,                                                               // nodes
                   0,   0,   0,   0,  3, 0, 0, 0, 4, 0, 0, 0,                                      //
                   4,   0,   0,   0,                                                               // size
                   't', 'e', 'x', 't'}))));
}

TEST_F(RoutedMessage, JoinsItsBuffersInOrder) {
  Bytes binary = octets({0, 255, 0});
  EXPECT_TRUE(succeeds([&] { return route({buffer(text), buffer(binary), buffer(more), buffer(text)}); }));
  EXPECT_TRUE(sent(expected({0, 3, 4}, "text" + octets({0, 255, 0}) + "moretext")));
}

TEST_F(RoutedMessage, WithoutBuffersIsABodyOfNoBytes) {
  EXPECT_TRUE(succeeds([this] { return route({}); }));
  EXPECT_TRUE(sent(expected({0, 3, 4}, "")));
}

TEST_F(RoutedMessage, OfSixBuffersIsSentOfSevenRefused) {
  EXPECT_TRUE(succeeds([this] { return route(std::vector<iovec>(6, buffer(text))); }));
  EXPECT_TRUE(sent(expected({0, 3, 4}, "texttexttexttexttexttext")));
  EXPECT_TRUE(is_refused_with(4, std::vector<iovec>(7, buffer(text))));
}

TEST_F(RoutedMessage, CarriesTheLow16BitsOfThePortSwapped) {
  const auto port_field = [this](int port) {
    EXPECT_TRUE(succeeds([&] { return route({buffer(text)}, port); }));
    return connection.receive_request().substr(76, 4);
  };
  EXPECT_EQ(octets({0x12, 0x34, 0, 0}), port_field(0x1234));
  EXPECT_EQ(octets({0x12, 0x34, 0, 0}), port_field(0x7ABC1234));
  EXPECT_EQ(octets({0xFF, 0x80, 0, 0}), port_field(0xFF80));
  EXPECT_EQ(octets({0xFF, 0xFF, 0, 0}), port_field(-1));
  EXPECT_EQ(octets({0, 0, 0, 0}), port_field(0x10000));
  EXPECT_EQ(octets({0, 0, 0, 0}), port_field(0));
}

// Nodes.

TEST_F(RoutedMessage, ToOneNodeMayNameAny) {
  nodes = {-5};
  EXPECT_TRUE(succeeds([this] { return route({buffer(text)}); }));
  EXPECT_TRUE(sent(expected({0xFFFFFFFB}, "text")));
}

TEST_F(RoutedMessage, ToTwoNodesIsAscendingAndLeavesTheArray) {
  nodes = {5, 3};
  EXPECT_TRUE(succeeds([this] { return route({buffer(text)}); }));
  EXPECT_TRUE(sent(expected({3, 5}, "text")));
  EXPECT_THAT(nodes, ElementsAre(5, 3));
  nodes = {3, 5};
  EXPECT_TRUE(succeeds([this] { return route({buffer(text)}); }));
  EXPECT_TRUE(sent(expected({3, 5}, "text")));
  EXPECT_THAT(nodes, ElementsAre(3, 5));
}

TEST_F(RoutedMessage, ToMoreNodesSortsTheArray) {
  nodes = {7, -1, 2048, 3, 0};
  EXPECT_TRUE(succeeds([this] { return route({buffer(text)}); }));
  EXPECT_TRUE(sent(expected({0xFFFFFFFF, 0, 3, 7, 2048}, "text")));
  EXPECT_THAT(nodes, ElementsAre(-1, 0, 3, 7, 2048));
}

TEST_F(RoutedMessage, ToTheExtremesOfNumbersSortsThemToo) {
  constexpr int least = std::numeric_limits<int>::min();
  constexpr int most = std::numeric_limits<int>::max();
  nodes = {most, 0, least, 1, -1};
  EXPECT_TRUE(succeeds([this] { return route({buffer(text)}); }));
  EXPECT_THAT(nodes, ElementsAre(least, -1, 0, 1, most));
}

TEST_F(RoutedMessage, ToANodeTwiceIsInvalid) {
  nodes = {5, 5};
  EXPECT_TRUE(is_refused_with(4, {buffer(text)}));
  nodes = {5, 3, 5};
  EXPECT_TRUE(is_refused_with(4, {buffer(text)}));
  EXPECT_THAT(nodes, ElementsAre(3, 5, 5));
  nodes = {1, 2, 3, 4, 1};
  EXPECT_TRUE(is_refused_with(4, {buffer(text)}));
  EXPECT_THAT(nodes, ElementsAre(1, 1, 2, 3, 4));
}

TEST_F(RoutedMessage, ToTooFewOrTooManyNodesIsInvalid) {
  iovec vector = buffer(text);
  count_nodes(2050);
  nodes[0] = 9999;
  for (const int count : {0, -1, std::numeric_limits<int>::min(), 2050, std::numeric_limits<int>::max()}) {
    EXPECT_TRUE(fails_with(4, [&] { return hb_daemon_route_mcast(&vector, 1, 80, nodes.data(), count); })) << count;
  }
  EXPECT_TRUE(nothing_sent());
  EXPECT_EQ(9999, nodes[0]);  // not sorted
}

TEST_F(RoutedMessage, ToAllNodesThereCanBeIsSent) {
  count_nodes(2049);
  std::reverse(nodes.begin(), nodes.end());
  std::vector<uint32_t> ascending(2049);
  std::iota(ascending.begin(), ascending.end(), 0U);
  EXPECT_TRUE(succeeds([this] { return route({buffer(text)}); }));
  EXPECT_TRUE(sent(expected(ascending, "text")));
  EXPECT_EQ(0, nodes.front());
  EXPECT_EQ(2048, nodes.back());
}

// Buffers.

TEST_F(RoutedMessage, WithABufferOfNothingIsInvalid) {
  const iovec null_base = {nullptr, 4};
  const iovec no_bytes = {text.data(), 0};
  EXPECT_TRUE(is_refused_with(4, {null_base}));
  EXPECT_TRUE(is_refused_with(4, {no_bytes}));
  EXPECT_TRUE(is_refused_with(4, {buffer(text), null_base, buffer(more)}));
  EXPECT_TRUE(is_refused_with(4, {buffer(text), buffer(more), no_bytes}));
}

TEST_F(RoutedMessage, WithoutPointersIsInvalid) {
  iovec vector = buffer(text);
  EXPECT_TRUE(fails_with(4, [&] { return hb_daemon_route_mcast(nullptr, 1, 80, nodes.data(), 3); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_daemon_route_mcast(nullptr, 0, 80, nodes.data(), 3); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_daemon_route_mcast(&vector, 1, 80, nullptr, 3); }));
  EXPECT_TRUE(nothing_sent());
  EXPECT_THAT(nodes, ElementsAre(4, 0, 3));
}

TEST_F(RoutedMessage, WithANegativeNumberOfBuffersIsInvalid) {
  iovec vector = buffer(text);
  for (const int count : {-1, std::numeric_limits<int>::min(), std::numeric_limits<int>::max()}) {
    EXPECT_TRUE(fails_with(4, [&] { return hb_daemon_route_mcast(&vector, count, 80, nodes.data(), 3); })) << count;
  }
  EXPECT_TRUE(nothing_sent());
  EXPECT_THAT(nodes, ElementsAre(4, 0, 3));
}

// Sizes: the message, 4 bytes for each node and 60 more may be 10,000.

TEST_F(RoutedMessage, Of9000BytesToOneNodeIsSent) {
  nodes = {3};
  EXPECT_TRUE(succeeds([this] { return route_bytes(9000); }));
  EXPECT_TRUE(sent(expected({3}, Bytes(9000, 'm'))));
}

TEST_F(RoutedMessage, FillsARequestToItsLastByte) {
  nodes = {3};
  EXPECT_TRUE(succeeds([this] { return route_bytes(9936); }));
  const Bytes frame = expected({3}, Bytes(9936, 'm'));
  EXPECT_EQ(4U + 76 + 10000, frame.size());
  EXPECT_TRUE(sent(frame));
  EXPECT_TRUE(fails_with(53, [this] { return route_bytes(9937); }));
  EXPECT_TRUE(nothing_sent());
}

TEST_F(RoutedMessage, GivesRoomToItsNodes) {
  EXPECT_TRUE(succeeds([this] { return route_bytes(9928); }));
  EXPECT_TRUE(sent(expected({0, 3, 4}, Bytes(9928, 'm'))));
  EXPECT_TRUE(fails_with(53, [this] { return route_bytes(9929); }));
  count_nodes(2049);
  EXPECT_TRUE(succeeds([this] { return route_bytes(1744); }));
  EXPECT_EQ(76U + 10000, connection.receive_request().size());
  EXPECT_TRUE(fails_with(53, [this] { return route_bytes(1745); }));
  EXPECT_TRUE(nothing_sent());
}

TEST_F(RoutedMessage, OfMoreThanTheLimitIsTooBig) {
  for (const size_t size : {size_t{10000}, size_t{10001}, size_t{100000}}) {
    EXPECT_TRUE(fails_with(53, [&] { return route_bytes(size); })) << size;
  }
  EXPECT_TRUE(nothing_sent());
}

TEST_F(RoutedMessage, AddsUpItsBuffersWithoutAnOverflow) {
  const iovec huge = {text.data(), std::numeric_limits<size_t>::max()};
  const iovec half = {text.data(), size_t{1} << 63U};
  EXPECT_TRUE(is_refused_with(53, {huge}));
  EXPECT_TRUE(is_refused_with(53, {huge, buffer(text)}));
  EXPECT_TRUE(is_refused_with(53, {half, half}));
  EXPECT_TRUE(is_refused_with(53, {buffer(text), half, half}));
}

TEST_F(RoutedMessage, OfTwoBuffersCountsBoth) {
  Bytes half(4964, 'm');
  EXPECT_TRUE(succeeds([&] { return route({buffer(half), buffer(half)}); }));
  EXPECT_TRUE(sent(expected({0, 3, 4}, Bytes(9928, 'm'))));
  Bytes other_half(4965, 'm');
  EXPECT_TRUE(is_refused_with(53, {buffer(half), buffer(other_half)}));
}

// The order of the checks.

TEST_F(RoutedMessage, IsCheckedForItsCountsBeforeItsNodes) {
  nodes = {5, 3, 5};
  EXPECT_TRUE(is_refused_with(4, std::vector<iovec>(7, buffer(text))));
  EXPECT_THAT(nodes, ElementsAre(5, 3, 5));
}

TEST_F(RoutedMessage, SortsItsNodesAlsoWhenABufferIsRefused) {
  EXPECT_TRUE(is_refused_with(4, {{nullptr, 4}}));
  EXPECT_THAT(nodes, ElementsAre(0, 3, 4));
  nodes = {4, 0, 3};
  EXPECT_TRUE(fails_with(53, [this] { return route_bytes(20000); }));
  EXPECT_THAT(nodes, ElementsAre(0, 3, 4));
}

TEST_F(RoutedMessage, ToANodeTwiceIsInvalidBeforeItIsTooBig) {
  nodes = {5, 5};
  EXPECT_TRUE(fails_with(4, [this] { return route_bytes(20000); }));
}

TEST_F(RoutedMessage, WithABufferOfNothingIsInvalidBeforeItIsTooBig) {
  Bytes large(20000, 'm');
  EXPECT_TRUE(is_refused_with(4, {buffer(large), {nullptr, 4}}));
}

// The order of numbers.

TEST(OrderOfNodes, IsTheirDifference) {
  const auto compared = [](int first, int second) { return int_compare(&first, &second); };
  EXPECT_EQ(2, compared(5, 3));
  EXPECT_EQ(-2, compared(3, 5));
  EXPECT_EQ(0, compared(5, 5));
  EXPECT_EQ(-10, compared(-7, 3));
  EXPECT_EQ(0, compared(-2147483647 - 1, -2147483647 - 1));
  EXPECT_EQ(2147483647, compared(2147483647, 0));
  EXPECT_EQ(-2147483647 - 1, compared(-2147483647 - 1, 0));
}

TEST(OrderOfNodes, StaysInOrderWhereTheDifferenceIsNoInt) {
  const auto compared = [](int first, int second) { return int_compare(&first, &second); };
  EXPECT_EQ(2147483647, compared(2147483647, -1));
  EXPECT_EQ(2147483647, compared(2147483647, -2147483647 - 1));
  EXPECT_EQ(-2147483647 - 1, compared(-2147483647 - 1, 1));
  EXPECT_EQ(-2147483647 - 1, compared(-2, 2147483647));
}

}  // namespace
}  // namespace hb_test
