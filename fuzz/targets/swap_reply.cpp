// The answer to a request that two adapters exchange their addresses.
#include "support/steering_reply.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  fuzz::run_steering_reply(fuzz::Awaited::swap, {bytes, size});
  return 0;
}
