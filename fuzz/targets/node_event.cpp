// Node death, join and new group, and the heartbeat settings.
#include <array>

#include "support/event_target.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static constexpr std::array<int32_t, 4> kinds = {5, 6, 7, 15};
  static fuzz::Event_Target target(fuzz::small_configuration(), true);
  target.run_packet({bytes, size}, kinds);
  return 0;
}
