#include "support/allocation_faults.h"

#include <cstdlib>
#include <new>

namespace {

struct Failure_Plan {
  size_t countdown = 0;  // 0: no failure is planned
  bool once = true;
  bool happened = false;
};

thread_local Failure_Plan plan;
thread_local long live = 0;
thread_local size_t last_size = 0;

bool runs_out() {
  if (plan.countdown == 0 || --plan.countdown > 0) {
    return false;
  }
  plan.happened = true;
  plan.countdown = plan.once ? 0 : 1;
  return true;
}

void* allocate(size_t size) {
  last_size = size;
  void* block = runs_out() ? nullptr : std::malloc(size == 0 ? 1 : size);
  live += block != nullptr ? 1 : 0;
  return block;
}

void* allocate_or_throw(size_t size) {
  void* block = allocate(size);
  if (block == nullptr) {
    throw std::bad_alloc();
  }
  return block;
}

void release(void* block) {
  live -= block != nullptr ? 1 : 0;
  std::free(block);
}

}  // namespace

void* operator new(size_t size) { return allocate_or_throw(size); }
void* operator new[](size_t size) { return allocate_or_throw(size); }
void* operator new(size_t size, const std::nothrow_t&) noexcept { return allocate(size); }
void* operator new[](size_t size, const std::nothrow_t&) noexcept { return allocate(size); }
void operator delete(void* block) noexcept { release(block); }
void operator delete[](void* block) noexcept { release(block); }
void operator delete(void* block, size_t) noexcept { release(block); }
void operator delete[](void* block, size_t) noexcept { release(block); }
void operator delete(void* block, const std::nothrow_t&) noexcept { release(block); }
void operator delete[](void* block, const std::nothrow_t&) noexcept { release(block); }

namespace hb_test {

AllocationFailure::AllocationFailure(size_t nth, bool once) { plan = {nth, once, false}; }
AllocationFailure::~AllocationFailure() { plan = {}; }
bool AllocationFailure::happened() const { return plan.happened; }

long live_allocations() { return live; }
size_t last_allocation() { return last_size; }

}  // namespace hb_test
