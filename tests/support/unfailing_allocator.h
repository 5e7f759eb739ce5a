// Memory beside operator new, so that what a double keeps neither fails nor counts when a test makes memory run out.
#pragma once

#include <cstddef>
#include <cstdlib>
#include <string>

template <typename Value>
struct Unfailing_Allocator {
  using value_type = Value;

  Unfailing_Allocator() = default;
  template <typename Other>
  explicit(false) Unfailing_Allocator(const Unfailing_Allocator<Other>& /*other*/) {}

  Value* allocate(size_t count) {
    void* block = std::malloc(count * sizeof(Value));
    if (block == nullptr) std::abort();
    return static_cast<Value*>(block);
  }
  void deallocate(Value* block, size_t /*count*/) { std::free(block); }

  bool operator==(const Unfailing_Allocator&) const = default;
};

using Unfailing_Text = std::basic_string<char, std::char_traits<char>, Unfailing_Allocator<char>>;
