// The records of VEX-mode events, 384 KiB each, from a pool: mapped and unmapped one by one they would take most of a
// run. A record that is not in use is poisoned, and the one that was released last is used again last, so that reads
// and writes behind its end or after its release are still found. --wrap puts these in front of the allocator's own.
#include "support/event_pool.h"

#include <sanitizer/asan_interface.h>

#include <array>
#include <cstddef>
#include <deque>
#include <new>

#include "hb_global_data/vex_event_queue.h"
#include "support/require.h"

namespace {

constexpr size_t pool_size = 24;
constexpr size_t gap = 4096;

class Event_Pool {
 public:
  Event_Pool() {
    __asan_poison_memory_region(bytes_.data(), bytes_.size());
    for (size_t slot = 0; slot < pool_size; ++slot) {
      free_.push_back(slot);
    }
  }

  // Null when none is left.
  void* take() {
    if (free_.empty()) {
      return nullptr;
    }
    const size_t slot = free_.front();
    free_.pop_front();
    in_use_[slot] = true;
    __asan_unpoison_memory_region(place(slot), sizeof(VEX_Event));
    return place(slot);
  }

  // False when it is none of the pool's.
  bool give_back(void* record) {
    auto* byte = static_cast<std::byte*>(record);
    if (byte < bytes_.data() || byte >= bytes_.data() + bytes_.size()) {
      return false;
    }
    const size_t slot = static_cast<size_t>(byte - bytes_.data()) / stride;
    REQUIRE(byte == place(slot) && in_use_[slot]);
    in_use_[slot] = false;
    free_.push_back(slot);
    __asan_poison_memory_region(byte, sizeof(VEX_Event));
    return true;
  }

  size_t used() const { return pool_size - free_.size(); }

 private:
  static constexpr size_t stride = (sizeof(VEX_Event) + 2 * gap) / gap * gap;

  std::byte* place(size_t slot) { return bytes_.data() + slot * stride + gap / 2; }

  alignas(gap) std::array<std::byte, pool_size * stride> bytes_{};
  std::array<bool, pool_size> in_use_{};
  std::deque<size_t> free_;
};

Event_Pool& pool() {
  static Event_Pool instance;
  return instance;
}

}  // namespace

size_t fuzz::events_in_use() { return pool().used(); }

extern "C" {

void* __real__ZnwmRKSt9nothrow_t(size_t size, const std::nothrow_t& tag);
void __real__ZdlPv(void* block);
void __real__ZdlPvm(void* block, size_t size);

void* __wrap__ZnwmRKSt9nothrow_t(size_t size, const std::nothrow_t& tag) {
  void* record = size == sizeof(VEX_Event) ? pool().take() : nullptr;
  return record != nullptr ? record : __real__ZnwmRKSt9nothrow_t(size, tag);
}

void __wrap__ZdlPv(void* block) {
  if (!pool().give_back(block)) {
    __real__ZdlPv(block);
  }
}

void __wrap__ZdlPvm(void* block, size_t size) {
  if (!pool().give_back(block)) {
    __real__ZdlPvm(block, size);
  }
}
}
