// Texts that are kept beyond the call that brought them.
#pragma once

#include <cstring>
#include <new>

// In a new array, or null without memory. Of a text that has no end within the longest one, so much is read and kept.
inline char* new_copy_of(const char* text, size_t longest) {
  const size_t length = strnlen(text, longest);
  auto* copy = new (std::nothrow) char[length + 1];
  if (copy != nullptr) {
    std::memcpy(copy, text, length);
    copy[length] = '\0';
  }
  return copy;
}

inline char* new_copy_of(const char* text) { return new_copy_of(text, std::strlen(text)); }
