// The answer to a question for a route.
#include "support/steering_reply.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  fuzz::run_steering_reply(fuzz::Awaited::route, {bytes, size});
  return 0;
}
