// What the daemon publishes, at the moment of attaching: hostile contents of the configuration segment, segments of the
// wrong size, and every call that may fail.
#include <array>

#include "hb_communication/shared_memory.h"
#include "support/conventions.h"
#include "support/system.h"

namespace {

using fuzz::the_system;

struct Publication {
  memory_configuration_data configuration;
  uint16_t published_routes;
};

// The steps of attaching, what the stand-in fails them with, and the number that each failure has to give.
constexpr int keys = 4;
constexpr std::array<int, keys> key_numbers = {28, 29, 54, 30};
constexpr size_t faults = 7;
constexpr std::array<int, faults> first_get_numbers = {31, 32, 33, 34, 35, 36, 36};  // EACCES ... ENFILE
constexpr std::array<int, faults> other_get_numbers = {31, 32, 33, 34, 36, 35, 36};
constexpr std::array<int, faults> attach_numbers = {37, 38, 39, 41, 42, 42, 42};
constexpr std::array<int, faults> semaphore_numbers = {43, 44, 45, 46, 47, 48, 48};
constexpr int size_does_not_fit = 32;

struct Outcome {
  int error;
  int attached;
};

// The script, read as the stand-in reads it.
class Script {
 public:
  explicit Script(fuzz::Bytes bytes) : input_(bytes.data(), bytes.size()) {}

  template <size_t N>
  int next(const std::array<int, N>& numbers) {
    const unsigned fault = input_.take<uint8_t>() & 15U;
    return fault == 0 || fault > N ? fuzz::no_error : numbers[fault - 1];
  }

 private:
  fuzz::Input input_;
};

Outcome outcome_of(Script script, uint64_t nodes, uint64_t published_routes) {
  for (const int number : key_numbers) {
    if (script.next(std::array{number}) != fuzz::no_error) {
      return {number, 0};
    }
  }
  for (int segment = 0; segment < 3; ++segment) {
    const int number = script.next(segment == 0 ? first_get_numbers : other_get_numbers);
    if (segment == 1 && nodes == 0) {
      return {size_does_not_fit, segment};  // whatever the system says
    }
    if (number != fuzz::no_error) {
      return {number, segment};
    }
    if (segment == 1 && nodes > published_routes) {
      return {size_does_not_fit, segment};
    }
    if (const int fault = script.next(attach_numbers)) {
      return {fault, segment};
    }
  }
  return {script.next(semaphore_numbers), 3};
}

void check_addresses(int attached) {
  REQUIRE(data_for_client == (attached > 0 ? &the_system.configuration : nullptr));
  REQUIRE(shared_route_info == (attached > 1 ? the_system.route_segment.data() : nullptr));
  REQUIRE(security_info == (attached > 2 ? &the_system.security : nullptr));
  REQUIRE(the_system.attached_segments == attached);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  fuzz::Input input(bytes, size);
  const auto publication = input.take<Publication>();
  const size_t routes = publication.published_routes % (the_system.route_segment.size() + 1);
  the_system.configuration = publication.configuration;
  the_system.route_segment_size = routes * sizeof(route_sequence);
  the_system.script = input.rest();
  const Outcome outcome = outcome_of(Script(input.rest()), publication.configuration.number_of_nodes, routes);
  fuzz::expect(outcome.error, hb_init_shared_memory);
  check_addresses(outcome.attached);
  hb_detach_shared_memory();
  check_addresses(0);
  hb_detach_shared_memory();
  check_addresses(0);
  return 0;
}
