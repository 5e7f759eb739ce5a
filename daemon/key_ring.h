/* The cluster's security keys. */
#ifndef HBD_KEY_RING_H
#define HBD_KEY_RING_H

#include <string>

#include "hb_protocol/shared_memory.h"

namespace hbd {

/**
 * The current key, the one before it, and up to 10 older ones, as they are published and nowhere else. Each is stored
 * with its type, version and length in front, 4 bytes each, little-endian. The memory is wiped in the end.
 */
class KeyRing {
 public:
  /**
   * Starts with one key.
   *
   * @param file where the key is; empty: keys are made at random.
   * @throws Failure when there is no key to start with.
   */
  explicit KeyRing(std::string file);
  KeyRing(const KeyRing&) = delete;
  KeyRing& operator=(const KeyRing&) = delete;
  ~KeyRing();

  /**
   * Puts a new key in the place of the current one, which becomes the one before. A file is read anew; while it holds
   * the current key, nothing happens.
   *
   * @return whether the keys are others now.
   * @throws Failure when there is no new key; the keys stay as they are.
   */
  bool rotate();

  /** The keys with their number, which is raised with each rotation. */
  [[nodiscard]] const security_information& published() const { return keys_; }

 private:
  [[nodiscard]] Hb_sec_buffer_desc new_key() const;
  [[nodiscard]] bool is_current(const Hb_sec_buffer_desc& key) const;
  void make_room();

  std::string file_;
  std::uint32_t version_ = 0;
  security_information keys_{};
};

}  // namespace hbd

#endif
