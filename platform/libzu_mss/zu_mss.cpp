// Typed keys: a header of type, version and length, then the value.
#include "zu_mss.h"

#include <cstddef>
#include <cstring>
#include <new>

namespace {

constexpr int32_t header_size = 12;
constexpr int32_t largest_key = 256;
constexpr size_t type_offset = 0;
constexpr size_t version_offset = 4;
constexpr size_t length_offset = 8;

uint32_t little_endian_32(const uint8_t* bytes) {
  return static_cast<uint32_t>(bytes[0]) | static_cast<uint32_t>(bytes[1]) << 8 |
         static_cast<uint32_t>(bytes[2]) << 16 | static_cast<uint32_t>(bytes[3]) << 24;
}

bool has_a_possible_size(const sec_buffer& buffer) {
  return buffer.value != nullptr && buffer.length >= header_size && buffer.length <= largest_key;
}

// Copies the value that follows the header; a key without a value has no memory.
bool copy_value(const uint8_t* value, size_t length, sec_key_desc& key) {
  if (length == 0) return true;
  auto* copy = new (std::nothrow) uint8_t[length];
  if (copy == nullptr) return false;
  std::memcpy(copy, value, length);
  key.value = copy;
  key.length = static_cast<int32_t>(length);
  return true;
}

}  // namespace

int sec_unmarshal_typed_key(const sec_buffer* buffer, sec_key_desc* key) {
  if (key == nullptr) return -1;
  *key = sec_key_desc{};
  if (buffer == nullptr || !has_a_possible_size(*buffer)) return -1;

  const auto* bytes = static_cast<const uint8_t*>(buffer->value);
  const auto value_length = static_cast<uint32_t>(buffer->length - header_size);
  if (little_endian_32(bytes + length_offset) != value_length) return -1;
  if (!copy_value(bytes + header_size, value_length, *key)) return -1;
  key->type = little_endian_32(bytes + type_offset);
  key->version = static_cast<int32_t>(little_endian_32(bytes + version_offset));
  return 0;
}

void sec_release_typed_key(sec_key_desc* key) {
  if (key == nullptr) return;
  if (key->value != nullptr && key->length > 0) explicit_bzero(key->value, static_cast<size_t>(key->length));
  delete[] static_cast<uint8_t*>(key->value);
  *key = sec_key_desc{};
}
