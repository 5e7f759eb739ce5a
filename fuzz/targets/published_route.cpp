// Reading a route: hostile contents of the route and the configuration segment, and a lock that may fail.
#include <array>

#include "hb_client.h"
#include "support/conventions.h"
#include "support/packets.h"
#include "support/system.h"

namespace {

using fuzz::the_system;

constexpr int nodes = 6;
constexpr int published = 4;  // fewer than the nodes
constexpr unsigned short no_length = 4711;

struct Publication {
  uint32_t sequence;
  std::array<route_sequence, published> routes;
  uint8_t routes_of_the_configuration;  // a set bit: that route has its number
  uint8_t script_length;
};

void start() {
  const fuzz::Buffer message = fuzz::small_configuration();
  const fuzz::Buffer frame = fuzz::framed(0, message);
  the_system.configuration.number_of_nodes = published;
  the_system.route_segment_size = published * sizeof(route_sequence);
  the_system.stream = frame;
  fuzz::expect(fuzz::no_error, hb_init);
}

void publish(const Publication& publication) {
  the_system.configuration.sequence_number = publication.sequence;
  for (size_t i = 0; i < published; ++i) {
    the_system.route_segment[i] = publication.routes[i];
    if ((publication.routes_of_the_configuration >> i & 1U) != 0) {
      the_system.route_segment[i].sequence_number = publication.sequence;
    }
  }
}

const route_sequence* current_route(int node) {
  const uint32_t current = the_system.configuration.sequence_number;
  if (node >= published || current == 0) {
    return nullptr;
  }
  const route_sequence& route = the_system.route_segment[static_cast<size_t>(node)];
  return route.sequence_number == current ? &route : nullptr;
}

int error_of(int node, bool ip_only) {
  if (node < 0 || node >= nodes) {
    return HB_EINVAL;
  }
  const route_sequence* route = current_route(node);
  if (route == nullptr) {
    return HB_ENOROUTE;
  }
  return ip_only && route->nonip != 0 ? int{HB_ENOIPROUTE} : fuzz::no_error;
}

void check_read(int16_t node, bool ip_only) {
  static constexpr Hb_Source_Route untouched = {};
  Hb_Source_Route option = untouched;
  unsigned short length = no_length;
  const int error = error_of(node, ip_only);
  fuzz::expect(error, [&] { return (ip_only ? hb_read_ip_route : hb_read_route)(node, &option, &length); });
  const bool found = error == fuzz::no_error;
  const auto* route = found ? current_route(node) : nullptr;
  REQUIRE(length == (found ? route->length : no_length));
  REQUIRE(std::memcmp(&option, found ? &route->ip_option : &untouched, sizeof option) == 0);
  REQUIRE(the_system.readers == 0);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static const bool started = (start(), true);
  REQUIRE(started);
  fuzz::Input input(bytes, size);
  const auto publication = input.take<Publication>();
  publish(publication);
  the_system.script = input.take_bytes(publication.script_length % 16U);
  const auto beyond = input.take<int16_t>();
  for (const int16_t node : {int16_t{0}, int16_t{1}, int16_t{published - 1}, int16_t{published}, beyond}) {
    check_read(node, false);
    check_read(node, true);
  }
  the_system.script = {};
  return 0;
}
