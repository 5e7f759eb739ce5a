// What the process holds, to be compared before and after.
#pragma once

#include <cstddef>

namespace hb_test {

// Open descriptors.
int open_descriptors();

// Shared-memory segments that are mapped.
int attached_segments();

// Threads.
int running_threads();

// What is allocated in its scope may stay: for what the library has to forget without releasing it.
class LeakAllowed {
 public:
  LeakAllowed();
  ~LeakAllowed();
  LeakAllowed(const LeakAllowed&) = delete;
  LeakAllowed& operator=(const LeakAllowed&) = delete;
};

}  // namespace hb_test
