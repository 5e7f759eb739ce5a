// Several packets in a row, configuration updates among them, so that each finds what the one before has left.
#include "support/event_target.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static fuzz::Event_Target target(fuzz::small_configuration(), true);
  target.run_sequence({bytes, size});
  return 0;
}
