// The answer to a request for a time of grace.
#include "support/steering_reply.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  fuzz::run_steering_reply(fuzz::Awaited::grace, {bytes, size});
  return 0;
}
