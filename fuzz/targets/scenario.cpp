// Any text as a scenario. What is accepted is a cluster that a client can load, before and after each of its changes.
#include <algorithm>

#include "cluster.h"
#include "packet_writer.h"
#include "scenario_parser.h"
#include "support/configuration_model.h"
#include "support/require.h"

namespace {

// Larger clusters take too long to be run through.
constexpr Hb_Adapter_Number largest_limit = 4096;
constexpr size_t most_steps = 32;

constexpr size_t frame_prefix = 4;
constexpr size_t packet_header = 108;

// The frame is as long as it says.
fuzz::Bytes packet_of(const hbd::SharedFrame& frame) {
  int32_t length = 0;
  REQUIRE(frame->size() >= frame_prefix + packet_header);
  std::memcpy(&length, frame->data(), sizeof length);
  REQUIRE(static_cast<size_t>(length) == frame->size() - frame_prefix);
  return fuzz::Bytes(*frame).subspan(frame_prefix);
}

int32_t kind_of(fuzz::Bytes packet) {
  int32_t kind = 0;
  std::memcpy(&kind, packet.data(), sizeof kind);
  return kind;
}

void check_configuration(fuzz::Bytes packet, int32_t kind) {
  REQUIRE(kind_of(packet) == kind);
  REQUIRE(fuzz::Configuration_Model::is_usable(packet.subspan(packet_header)));
}

void check_event(const hbd::Event& event, const hbd::Cluster& cluster) {
  constexpr int32_t update = 9;
  const hbd::SharedFrame frame = hbd::event_frame(event, cluster);
  const fuzz::Bytes packet = packet_of(frame);
  const int32_t kind = kind_of(packet);
  REQUIRE((kind >= 2 && kind <= 7) || kind == update || kind == 12 || kind == 13 || kind == 15);
  if (kind == update) {
    check_configuration(packet, update);
  }
}

void check_adapters(const hbd::Configuration& configuration) {
  for (const auto& [number, adapter] : configuration.adapters) {
    REQUIRE(number == adapter.number && number < configuration.adapter_limit());
    REQUIRE(adapter.network >= 0 && static_cast<size_t>(adapter.network) < configuration.networks.size());
    REQUIRE(adapter.type.size() < 36);
  }
}

void run(const hbd::Scenario& scenario) {
  hbd::Cluster cluster(scenario.configuration);
  check_configuration(packet_of(hbd::configuration_frame(cluster)), 0);
  for (size_t i = 0; i < std::min(scenario.steps.size(), most_steps); ++i) {
    for (const hbd::Event& event : cluster.apply(scenario.steps[i].change)) {
      check_event(event, cluster);
    }
    check_adapters(cluster.configuration());
  }
}

void check(const hbd::Scenario& scenario) {
  const hbd::Configuration& configuration = scenario.configuration;
  REQUIRE(configuration.max_nodes >= 1 && configuration.max_nodes <= 2049);
  REQUIRE(configuration.adapters_per_node >= 1 && configuration.networks.size() <= 48);
  REQUIRE(configuration.local_node >= 0 && configuration.local_node < configuration.max_nodes);
  REQUIRE(int64_t{configuration.max_nodes} * configuration.adapters_per_node <= 98352);
  check_adapters(configuration);
  REQUIRE(std::is_sorted(scenario.steps.begin(), scenario.steps.end(),
                         [](const hbd::Step& a, const hbd::Step& b) { return a.at < b.at; }));
  if (configuration.adapter_limit() <= largest_limit) {
    run(scenario);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(bytes), size);
  const auto result = hbd::parse_scenario(text);
  if (const auto* error = std::get_if<hbd::ScenarioError>(&result)) {
    const auto lines = static_cast<size_t>(std::count(text.begin(), text.end(), '\n')) + 1;
    REQUIRE(!error->text.empty() && error->line <= lines);
    return 0;
  }
  check(std::get<hbd::Scenario>(result));
  return 0;
}
