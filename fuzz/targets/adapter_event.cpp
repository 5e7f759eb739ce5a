// Adapter death, join and new group.
#include <array>

#include "support/event_target.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static constexpr std::array<int32_t, 3> kinds = {2, 3, 4};
  static fuzz::Event_Target target(fuzz::small_configuration(), true);
  target.run_packet({bytes, size}, kinds);
  return 0;
}
