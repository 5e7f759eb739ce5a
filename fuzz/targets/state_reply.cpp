// The answer to a question for an adapter's state.
#include "support/steering_reply.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  fuzz::run_steering_reply(fuzz::Awaited::state, {bytes, size});
  return 0;
}
