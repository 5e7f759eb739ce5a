// Marshalled keys of any content, as they are read from the security segment.
#include <cstring>

#include "support/input.h"
#include "support/require.h"
#include "zu_mss.h"

namespace {

uint32_t little_endian(const uint8_t* bytes) {
  return static_cast<uint32_t>(bytes[0]) | static_cast<uint32_t>(bytes[1]) << 8U |
         static_cast<uint32_t>(bytes[2]) << 16U | static_cast<uint32_t>(bytes[3]) << 24U;
}

// Type, version and length of four bytes each, then the value, 256 bytes at most.
bool is_well_formed(fuzz::Bytes key) {
  return key.size() >= 12 && key.size() <= 256 && little_endian(key.data() + 8) == key.size() - 12;
}

bool is_all_zero(const sec_key_desc& key) {
  return key.type == 0 && key.version == 0 && key.length == 0 && key.value == nullptr && key.schedule == nullptr;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  fuzz::Input input(bytes, size);
  const auto claimed_length = input.take<int16_t>();
  const fuzz::Bytes value = input.rest();
  // A stored length that says more than is there is refused by whoever reads the segment, but not a negative one.
  const bool fits = claimed_length <= static_cast<int>(value.size());
  const sec_buffer buffer = {fits ? claimed_length : static_cast<int32_t>(value.size()), value.data()};
  const fuzz::Bytes key = buffer.length > 0 ? value.first(static_cast<size_t>(buffer.length)) : fuzz::Bytes();

  sec_key_desc unmarshalled = {7, 7, 7, nullptr, nullptr};
  const int result = sec_unmarshal_typed_key(&buffer, &unmarshalled);
  REQUIRE(result == (is_well_formed(key) ? 0 : -1));
  if (result == 0) {
    REQUIRE(unmarshalled.type == little_endian(key.data()));
    REQUIRE(unmarshalled.version == static_cast<int32_t>(little_endian(key.data() + 4)));
    REQUIRE(unmarshalled.length == static_cast<int32_t>(key.size()) - 12);
    REQUIRE(unmarshalled.length == 0 || std::memcmp(unmarshalled.value, key.data() + 12, key.size() - 12) == 0);
    sec_release_typed_key(&unmarshalled);
  }
  REQUIRE(is_all_zero(unmarshalled));
  sec_release_typed_key(&unmarshalled);
  return 0;
}
