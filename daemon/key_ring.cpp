#include "key_ring.h"

#include <fmt/format.h>
#include <strings.h>
#include <sys/random.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <span>
#include <utility>

#include "failure.h"
#include "key_file.h"

namespace hbd {
namespace {

constexpr std::uint32_t key_type = 1;
constexpr std::size_t random_size = 32;
constexpr std::size_t version_at = 4;
constexpr std::size_t length_at = 8;
constexpr std::size_t value_at = 12;

/* Wipes a key that is on its way into the ring. */
class Wiped {
 public:
  explicit Wiped(Hb_sec_buffer_desc& key) : key_(key) {}
  Wiped(const Wiped&) = delete;
  Wiped& operator=(const Wiped&) = delete;
  ~Wiped() { explicit_bzero(&key_, sizeof(key_)); }

 private:
  Hb_sec_buffer_desc& key_;
};

void put_little_endian(std::uint8_t* to, std::uint32_t number) {
  for (int i = 0; i < 4; ++i) {
    to[i] = static_cast<std::uint8_t>(number >> (8 * i));
  }
}

std::size_t fill_at_random(std::span<std::uint8_t> value) {
  const ssize_t size = getrandom(value.data(), random_size, 0);
  if (size != static_cast<ssize_t>(random_size)) {
    throw Failure(fmt::format("making a key at random failed: {}; give one with --key-file", std::strerror(errno)));
  }
  return random_size;
}

}  // namespace

KeyRing::KeyRing(std::string file) : file_(std::move(file)) { rotate(); }

KeyRing::~KeyRing() { explicit_bzero(&keys_, sizeof(keys_)); }

bool KeyRing::rotate() {
  Hb_sec_buffer_desc key = new_key();
  const Wiped wiped(key);
  if (is_current(key)) {
    return false;
  }
  make_room();
  put_little_endian(key.value + version_at, ++version_);
  Hb_Shared_Security_Status& current = keys_.current_sec_status;
  current = {Hb_True, 1, Hb_False, Hb_True, Hb_True, {}};
  current.key = key; /* by itself: no copy of it stays behind on the stack */
  keys_.sequence_number += keys_.sequence_number == UINT32_MAX ? 2 : 1;
  return true;
}

Hb_sec_buffer_desc KeyRing::new_key() const {
  Hb_sec_buffer_desc key{};
  const auto value = std::span(key.value).subspan(value_at);
  const std::size_t size = file_.empty() ? fill_at_random(value) : read_key_file(file_, value);
  put_little_endian(key.value, key_type);
  put_little_endian(key.value + length_at, static_cast<std::uint32_t>(size));
  key.length = static_cast<std::int32_t>(value_at + size);
  return key;
}

/* Versions differ always, so it is the value that counts. */
bool KeyRing::is_current(const Hb_sec_buffer_desc& key) const {
  const Hb_sec_buffer_desc& current = keys_.current_sec_status.key;
  return key.length == current.length &&
         std::memcmp(key.value + value_at, current.value + value_at, sizeof(key.value) - value_at) == 0;
}

void KeyRing::make_room() {
  Hb_Shared_Key_Cache& cache = keys_.cache;
  if (keys_.previous_sec_status.key.length != 0) {
    std::move_backward(std::begin(cache.keyCache), std::end(cache.keyCache) - 1, std::end(cache.keyCache));
    cache.keyCache[0] = keys_.previous_sec_status.key;
    cache.keyCacheCount = std::min<std::uint32_t>(cache.keyCacheCount + 1, HB_KEY_CACHE_SIZE);
  }
  keys_.previous_sec_status = keys_.current_sec_status;
  keys_.previous_sec_status.is_valid_for_signing = Hb_False;
}

}  // namespace hbd
