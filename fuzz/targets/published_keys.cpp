// Reading the security keys: hostile contents of the security segment.
#include "hb_client.h"
#include "support/conventions.h"
#include "support/packets.h"
#include "support/system.h"

namespace {

using fuzz::the_system;

constexpr int32_t front_size = 12;

void start() {
  const fuzz::Buffer message = fuzz::small_configuration();
  const fuzz::Buffer frame = fuzz::framed(0, message);
  the_system.stream = frame;
  fuzz::expect(fuzz::no_error, hb_init);
}

// A key as it is handed out, read independently of the library.
struct Stored {
  explicit Stored(const Hb_sec_buffer_desc& stored) : bytes(reinterpret_cast<const uint8_t*>(&stored.value)) {
    length = stored.length;
    std::memcpy(&type, bytes, sizeof type);
    std::memcpy(&version, bytes + 4, sizeof version);
    std::memcpy(&value_length, bytes + 8, sizeof value_length);
  }

  bool is_none() const { return length == 0; }
  bool is_good() const { return length >= front_size && length <= 256 && value_length == length - front_size; }

  const uint8_t* bytes;
  int32_t length;
  uint32_t type = 0;
  int32_t version = 0;
  int32_t value_length = 0;
};

bool is_nothing(const sec_key_desc& key) {
  return key.type == 0 && key.version == 0 && key.length == 0 && key.value == nullptr && key.schedule == nullptr;
}

// Whether the key was one to be handed out; if not, no later one is.
bool check_key(const Hb_sec_buffer_desc& published, const sec_key_desc& key) {
  const Stored stored(published);
  if (stored.is_none() || !stored.is_good()) {
    REQUIRE(is_nothing(key));
    return stored.is_none();
  }
  REQUIRE(key.type == stored.type && key.version == stored.version && key.length == stored.value_length);
  REQUIRE(key.length == 0 || std::memcmp(key.value, stored.bytes + front_size, static_cast<size_t>(key.length)) == 0);
  return true;
}

bool check_status(const Hb_Shared_Security_Status& published, const Hb_Security_Status& status) {
  REQUIRE(std::memcmp(&published, &status, 5 * sizeof(int32_t)) == 0);
  return check_key(published.key, status.key);
}

bool check_cache(const Hb_Shared_Key_Cache& published, const Hb_Key_Cache& cache) {
  for (size_t i = 0; i < HB_KEY_CACHE_SIZE; ++i) {
    if (!check_key(published.keyCache[i], cache.keyCache[i])) {
      return false;
    }
  }
  return cache.keyCacheCount == published.keyCacheCount;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static const bool started = (start(), true);
  REQUIRE(started);
  the_system.security = fuzz::Input(bytes, size).take<security_information>();
  const security_information& published = the_system.security;

  Hb_Sequence_Number sequence = 0;
  fuzz::expect(fuzz::no_error, [&] { return hb_get_security_sequence(&sequence); });
  REQUIRE(sequence == published.sequence_number);

  Hb_Security_Status current = {};
  Hb_Security_Status previous = {};
  Hb_Key_Cache cache = {};
  set_hb_errno(fuzz::no_number);
  const Hb_Rc result = hb_get_security_infomation(&current, &previous, &cache);
  const bool all_good = check_status(published.current_sec_status, current) &&
                        check_status(published.previous_sec_status, previous) && check_cache(published.cache, cache);
  REQUIRE(result == (all_good ? Hb_Success : Hb_Failure));
  REQUIRE(hb_get_errno() == fuzz::no_number);

  fuzz::expect(fuzz::no_error, [&] { return hb_free_security_info_keys(&current, &previous, &cache); });
  for (const sec_key_desc& key : cache.keyCache) {
    REQUIRE(key.value == nullptr);
  }
  REQUIRE(current.key.value == nullptr && previous.key.value == nullptr);
  return 0;
}
