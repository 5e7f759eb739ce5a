/* Packets out of a stream. */
#include "frame_reader.h"

#include <gtest/gtest.h>

#include "wire.h"

namespace {

using hbd::FrameReader;

TEST(FrameReader, finds_a_packet_whose_bytes_come_one_by_one) {
  FrameReader reader;
  const Bytes framed = request(204, Bytes(3, 0));
  for (std::size_t i = 0; i + 1 < framed.size(); ++i) {
    reader.append({&framed[i], 1});
    ASSERT_EQ(reader.next(), FrameReader::State::Incomplete);
  }
  reader.append({&framed.back(), 1});
  ASSERT_EQ(reader.next(), FrameReader::State::Packet);
  EXPECT_EQ(Bytes(reader.packet().begin(), reader.packet().end()), Bytes(framed.begin() + 4, framed.end()));
  EXPECT_EQ(reader.next(), FrameReader::State::Incomplete);
}

TEST(FrameReader, finds_all_packets_of_one_piece) {
  FrameReader reader;
  reader.append(ByteWriter().raw(request(201, {})).raw(request(207, {1, 0})).u16(7).bytes());
  ASSERT_EQ(reader.next(), FrameReader::State::Packet);
  EXPECT_EQ(reader.packet().size(), 76U);
  ASSERT_EQ(reader.next(), FrameReader::State::Packet);
  EXPECT_EQ(reader.packet().size(), 78U);
  EXPECT_EQ(reader.next(), FrameReader::State::Incomplete);
}

TEST(FrameReader, takes_the_longest_request_and_refuses_one_more_byte) {
  FrameReader longest;
  longest.append(request_with_number(206, 98351));
  EXPECT_EQ(longest.next(), FrameReader::State::Packet);
  FrameReader longer;
  longer.append(ByteWriter().u32(76 + 98352).bytes());
  EXPECT_EQ(longer.next(), FrameReader::State::BadLength);
  EXPECT_EQ(longer.length(), 98428);
}

TEST(FrameReader, refuses_a_length_before_its_bytes_have_come) {
  for (const std::uint32_t length : {0U, 75U, 0x7FFFFFFFU, 0x80000000U, 0xFFFFFFFFU}) {
    FrameReader reader;
    reader.append(ByteWriter().u32(length).bytes());
    EXPECT_EQ(reader.next(), FrameReader::State::BadLength) << length;
  }
}

}  // namespace
