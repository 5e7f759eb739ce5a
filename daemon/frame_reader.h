/* Packets, from the stream of one client. */
#ifndef HBD_FRAME_READER_H
#define HBD_FRAME_READER_H

#include <cstdint>
#include <span>
#include <vector>

namespace hbd {

/** Collects received bytes and hands out whole packets. */
class FrameReader {
 public:
  enum class State { Incomplete, Packet, BadLength };

  /** Takes bytes as they were received. */
  void append(std::span<const std::uint8_t> bytes);

  /** Looks for the next packet. After `Packet` it is in packet(); after `BadLength` the stream is of no more use. */
  State next();

  /** The packet found last, valid until the next call of append(). */
  [[nodiscard]] std::span<const std::uint8_t> packet() const { return packet_; }
  /** The length read last. */
  [[nodiscard]] std::int32_t length() const { return length_; }

 private:
  std::vector<std::uint8_t> bytes_;
  std::size_t taken_ = 0;
  std::int32_t length_ = 0;
  std::span<const std::uint8_t> packet_;
};

}  // namespace hbd

#endif
