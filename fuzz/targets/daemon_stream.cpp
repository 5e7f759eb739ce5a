// The bytes of a client, as the daemon receives them: in pieces of any size, framed well or not.
#include <vector>

#include "frame_reader.h"
#include "request_parser.h"
#include "support/input.h"
#include "support/require.h"

namespace {

// What the stream holds, found by looking at all of it at once.
class Expected_Packets {
 public:
  explicit Expected_Packets(fuzz::Bytes stream) : stream_(stream) {}

  hbd::FrameReader::State next(size_t received, fuzz::Bytes& packet) {
    int32_t length = 0;
    if (received < position_ + sizeof length) {
      return hbd::FrameReader::State::Incomplete;
    }
    std::memcpy(&length, stream_.data() + position_, sizeof length);
    if (length < 76 || length > 76 + 98351) {
      return hbd::FrameReader::State::BadLength;
    }
    if (received - position_ - sizeof length < static_cast<size_t>(length)) {
      return hbd::FrameReader::State::Incomplete;
    }
    packet = stream_.subspan(position_ + sizeof length, static_cast<size_t>(length));
    position_ += sizeof length + packet.size();
    return hbd::FrameReader::State::Packet;
  }

 private:
  fuzz::Bytes stream_;
  size_t position_ = 0;
};

bool is_equal(fuzz::Bytes a, fuzz::Bytes b) {
  return a.size() == b.size() && (a.empty() || std::memcmp(a.data(), b.data(), a.size()) == 0);
}

// Takes every packet that is there. False when the stream is of no more use.
bool take_packets(hbd::FrameReader& reader, Expected_Packets& expected, size_t received) {
  for (;;) {
    fuzz::Bytes packet;
    const hbd::FrameReader::State state = expected.next(received, packet);
    REQUIRE(reader.next() == state);
    if (state != hbd::FrameReader::State::Packet) {
      return state == hbd::FrameReader::State::Incomplete;
    }
    REQUIRE(is_equal(reader.packet(), packet));
    hbd::parse_request(reader.packet());
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  fuzz::Input input(bytes, size);
  const fuzz::Bytes cuts = input.take_bytes(input.take<uint8_t>() % 32U);
  const fuzz::Bytes stream = input.rest();
  hbd::FrameReader reader;
  Expected_Packets expected(stream);
  size_t received = 0;
  for (const uint8_t cut : cuts) {
    const fuzz::Bytes piece = input.take_bytes(cut);
    reader.append(piece);
    received += piece.size();
    if (!take_packets(reader, expected, received)) {
      return 0;
    }
  }
  reader.append(input.rest());
  take_packets(reader, expected, stream.size());
  return 0;
}
