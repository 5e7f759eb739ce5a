// A descriptor that closes itself, and whole reads and writes on it. A failure is thrown.
#pragma once

#include <cstddef>
#include <string>
#include <utility>

#include "cluster.h"

namespace bench {

class Descriptor {
 public:
  Descriptor() = default;
  explicit Descriptor(int descriptor) : descriptor_(descriptor) {}
  ~Descriptor();
  Descriptor(Descriptor&& other) noexcept : descriptor_(std::exchange(other.descriptor_, -1)) {}
  Descriptor& operator=(Descriptor&& other) noexcept;

  int get() const { return descriptor_; }
  int release() { return std::exchange(descriptor_, -1); }
  void close();

 private:
  int descriptor_ = -1;
};

// Throws std::system_error of errno, with what failed.
[[noreturn]] void throw_errno(const std::string& what);

void write_all(int descriptor, const Bytes& bytes);

// False at end of file.
bool read_all(int descriptor, char* bytes, size_t size);

// Asks for room for so many bytes to be sent before anybody reads; the system may grant less.
void make_room(int descriptor, size_t bytes);

// Bytes that may be under way, with what the system adds to each packet.
size_t room(int descriptor);

}  // namespace bench
