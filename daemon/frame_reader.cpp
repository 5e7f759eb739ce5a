#include "frame_reader.h"

#include <cstring>

#include "hb_protocol/framing.h"
#include "request_parser.h"

namespace hbd {

void FrameReader::append(std::span<const std::uint8_t> bytes) {
  bytes_.erase(bytes_.begin(), bytes_.begin() + static_cast<std::ptrdiff_t>(taken_));
  taken_ = 0;
  bytes_.insert(bytes_.end(), bytes.begin(), bytes.end());
}

FrameReader::State FrameReader::next() {
  const std::span<const std::uint8_t> rest = std::span(bytes_).subspan(taken_);
  if (rest.size() < HB_FRAME_PREFIX_SIZE) {
    return State::Incomplete;
  }
  std::memcpy(&length_, rest.data(), sizeof(length_));
  if (length_ < shortest_request || length_ > longest_request) {
    return State::BadLength;
  }
  const auto size = static_cast<std::size_t>(length_);
  if (rest.size() - HB_FRAME_PREFIX_SIZE < size) {
    return State::Incomplete;
  }
  packet_ = rest.subspan(HB_FRAME_PREFIX_SIZE, size);
  taken_ += HB_FRAME_PREFIX_SIZE + size;
  return State::Packet;
}

}  // namespace hbd
