// A subscription group with a record of any kind, and operations on it in any order.
#include "hb_client/lifecycle.h"
#include "support/conventions.h"
#include "support/packets.h"
#include "support/subscription_check.h"
#include "support/system.h"

namespace {

fuzz::Configuration_Model start() {
  const fuzz::Buffer message = fuzz::small_configuration();
  const fuzz::Buffer frame = fuzz::framed(0, message);
  fuzz::the_system.stream = frame;
  fuzz::expect(fuzz::no_error, hb_init);
  fuzz::Configuration_Model model;
  model.load(message);
  return model;
}

// One operation: which, and on what.
struct Operation {
  uint8_t number;
  uint8_t adapter;
  int16_t node;
  int16_t network;
  uint16_t events;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static fuzz::Configuration_Model model = start();
  constexpr int most_operations = 64;
  fuzz::Input input(bytes, size);
  auto hostile = input.take<fuzz::Hostile>();
  fuzz::Subscription_Check check(model, hostile);
  for (int i = 0; i < most_operations && !input.empty(); ++i) {
    const auto operation = input.take<Operation>();
    check.perform(operation.number, hostile);
    hostile.adapter = operation.adapter;
    hostile.node = operation.node;
    hostile.network = operation.network;
    hostile.subscription_events = operation.events;
  }
  check.compare_all();
  return 0;
}
