// The fuzzer's bytes, taken from front to back. What is taken behind their end is zero.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <span>

namespace fuzz {

using Bytes = std::span<const uint8_t>;

class Input {
 public:
  Input(const uint8_t* bytes, size_t size) : rest_(bytes, size) {}

  bool empty() const { return rest_.empty(); }
  Bytes rest() const { return rest_; }

  Bytes take_bytes(size_t count) {
    const Bytes taken = rest_.first(std::min(count, rest_.size()));
    rest_ = rest_.subspan(taken.size());
    return taken;
  }

  template <typename T>
  T take() {
    T value{};
    const Bytes taken = take_bytes(sizeof value);
    if (!taken.empty()) {
      std::memcpy(&value, taken.data(), taken.size());
    }
    return value;
  }

 private:
  Bytes rest_;
};

}  // namespace fuzz
