// A sender of another configuration instance.
#include <array>

#include "support/event_target.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static constexpr std::array<int32_t, 1> kinds = {13};
  static fuzz::Event_Target target(fuzz::small_configuration(), true);
  target.run_packet({bytes, size}, kinds);
  return 0;
}
