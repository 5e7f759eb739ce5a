// Records of a list by a hash of their key, without walking the list. Candidates for a key come in the reverse of the
// order in which they were put in, which matters only to who wants the first of several. Without memory every record is
// a candidate for every key, in the order of their numbers.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <new>

class Chain_Index {
 public:
  static constexpr uint32_t none = UINT32_MAX;

  explicit Chain_Index(uint32_t records) : records_(records), mask_(std::bit_ceil(records | 1U) - 1) {
    heads_.reset(new (std::nothrow) uint32_t[size_t{mask_} + 1]);
    next_.reset(new (std::nothrow) uint32_t[size_t{records} + 1]);
    if (heads_ == nullptr || next_ == nullptr) {
      heads_ = nullptr;
    } else {
      std::memset(heads_.get(), 0xFF, (size_t{mask_} + 1) * sizeof(uint32_t));
    }
  }

  // Who wants the first of the list puts in the last one first; everybody else in any order.
  void put(uint32_t record, uint32_t hash) {
    if (heads_ != nullptr) {
      next_[record] = heads_[hash & mask_];
      heads_[hash & mask_] = record;
    }
  }

  // The first candidate, and the one after it, or none.
  uint32_t first(uint32_t hash) const { return heads_ != nullptr ? heads_[hash & mask_] : in_list(0); }
  uint32_t after(uint32_t record) const { return heads_ != nullptr ? next_[record] : in_list(record + 1); }

 private:
  uint32_t in_list(uint32_t record) const { return record < records_ ? record : none; }

  uint32_t records_;
  uint32_t mask_;
  std::unique_ptr<uint32_t[]> heads_;
  std::unique_ptr<uint32_t[]> next_;
};

// A hash of one value after the other, starting from 0. Equal texts are hashed up to their length.
inline uint32_t hash_with(uint32_t hash, uint32_t value) {
  constexpr uint32_t odd = 0x9E3779B1U;
  hash = (std::rotl(hash, 5) ^ value) * odd;
  return hash ^ (hash >> 15);
}

inline uint32_t hash_with_text(uint32_t hash, const char* text, size_t longest) {
  for (size_t i = 0; i < longest && text[i] != '\0'; ++i) {
    hash = hash_with(hash, static_cast<unsigned char>(text[i]));
  }
  return hash;
}

// Of 16 bytes.
inline uint32_t hash_with_address(uint32_t hash, const void* address) {
  uint32_t words[4];
  std::memcpy(words, address, sizeof words);
  for (const uint32_t word : words) {
    hash = hash_with(hash, word);
  }
  return hash;
}
