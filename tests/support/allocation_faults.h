// Memory that runs out on purpose, and counting what is allocated. For executables made with ALLOCATION_FAULTS.
#pragma once

#include <cstddef>

namespace hb_test {

// While it lives, allocations of this thread by operator new fail from the n-th on (1 is the next one), or only the
// n-th when `once` is set. Throwing forms throw std::bad_alloc, the others yield null.
class AllocationFailure {
 public:
  explicit AllocationFailure(size_t nth, bool once = true);
  ~AllocationFailure();
  AllocationFailure(const AllocationFailure&) = delete;
  AllocationFailure& operator=(const AllocationFailure&) = delete;

  // Whether an allocation failed.
  bool happened() const;
};

// Blocks that this thread got from operator new minus those that it gave back.
long live_allocations();

// Bytes of this thread's last allocation by operator new.
size_t last_allocation();

}  // namespace hb_test
