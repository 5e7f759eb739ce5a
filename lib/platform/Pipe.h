// A pipe of the library's own: making it, and writing a byte into it.
#pragma once

#include <sys/types.h>

#include <cstdint>

// Both ends close with it, unless somebody took them over, and in programs that the caller starts.
class Pipe {
 public:
  Pipe();
  ~Pipe();
  Pipe(const Pipe&) = delete;
  Pipe& operator=(const Pipe&) = delete;

  bool is_open() const { return is_open_; }

  // From then on nobody waits for a byte, or for room. False when the system does not allow it.
  bool read_without_waiting();
  bool write_without_waiting();

  // Read end, write end.
  int32_t* ends() { return ends_; }

  // The ends are somebody else's from then on.
  void hand_over() { is_open_ = false; }

 private:
  int32_t ends_[2] = {-1, -1};
  bool is_open_;
};

// As write() of one byte. Where nobody can read it fails with EPIPE and raises no signal. The byte outlives a thread
// that is cancelled while it waits for room.
ssize_t write_to_pipe(int descriptor, const char& byte);
