// The answer to a request that an adapter loses its address.
#include "support/steering_reply.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  fuzz::run_steering_reply(fuzz::Awaited::unconfigure, {bytes, size});
  return 0;
}
