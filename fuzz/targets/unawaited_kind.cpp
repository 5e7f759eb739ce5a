// Packets that are no event: answers that nobody awaits, and kinds that do not exist.
#include <array>

#include "support/event_target.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static constexpr std::array<int32_t, 10> kinds = {0, 1, 8, 10, 11, 14, 16, -1, INT32_MAX, INT32_MIN};
  static fuzz::Event_Target target(fuzz::small_configuration(), true);
  target.run_packet({bytes, size}, kinds);
  return 0;
}
