#include "hb_communication/packet.h"

#include <new>

Packet::Packet(char* bytes, size_t length) : bytes_(bytes), length_(length) {
  if (length >= HB_REPLY_HEADER_SIZE) {
    return;
  }
  std::unique_ptr<char[]> header(new (std::nothrow) char[HB_REPLY_HEADER_SIZE]());
  if (header != nullptr) {
    std::memcpy(header.get(), bytes, length);
  }
  bytes_ = std::move(header);
}
