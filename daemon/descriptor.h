/* An open file descriptor that closes itself. */
#ifndef HBD_DESCRIPTOR_H
#define HBD_DESCRIPTOR_H

#include <unistd.h>

#include <utility>

namespace hbd {

/** Owner of a file descriptor; -1 means none. */
class Descriptor {
 public:
  explicit Descriptor(int value = -1) : value_(value) {}
  Descriptor(Descriptor&& other) noexcept : value_(std::exchange(other.value_, -1)) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    if (this != &other) {
      close();
      value_ = std::exchange(other.value_, -1);
    }
    return *this;
  }
  ~Descriptor() { close(); }

  [[nodiscard]] int get() const { return value_; }
  [[nodiscard]] bool valid() const { return value_ >= 0; }

  /** Closes it now. */
  void close() {
    if (value_ >= 0) {
      ::close(std::exchange(value_, -1));
    }
  }

 private:
  int value_;
};

}  // namespace hbd

#endif
