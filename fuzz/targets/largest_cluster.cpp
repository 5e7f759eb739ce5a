// Events of every kind but the configuration update in the largest cluster that there can be, where each list ends at
// the end of its array.
#include <array>

#include "support/event_target.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static constexpr std::array<int32_t, 9> kinds = {2, 3, 4, 5, 6, 7, 12, 13, 15};
  static fuzz::Event_Target target(fuzz::largest_configuration(), false);
  target.run_packet({bytes, size}, kinds);
  return 0;
}
