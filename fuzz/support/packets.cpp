#include "support/packets.h"

#include "support/configuration_model.h"

namespace fuzz {

namespace {

void append(Buffer& to, const void* bytes, size_t length) {
  const auto* begin = static_cast<const uint8_t*>(bytes);
  to.insert(to.end(), begin, begin + length);
}

Hb_Adapter adapter_of(Hb_Adapter_Number number, Hb_Network_Number network, uint32_t address) {
  Hb_Adapter adapter = {};
  adapter.Hb_ip_address.v4_in_v6 = {{0, 0, htonl(0xFFFF)}, htonl(address)};
  adapter.Hb_network = network;
  std::memcpy(adapter.Hb_adapter_type, "en0", 4);
  adapter.Hb_adapter_num = number;
  adapter.Hb_state = Hb_Entity_Up;
  return adapter;
}

Hb_Network network_of(const char* name) {
  Hb_Network network = {};
  std::memcpy(network.Hb_network_name, name, std::strlen(name));
  std::memcpy(network.Hb_network_type, "ether", 6);
  return network;
}

Buffer message_with(const hb_configuration_header& header, const std::vector<Hb_Adapter>& adapters,
                    const std::vector<Hb_Network>& networks) {
  Buffer message;
  append(message, &header, sizeof header);
  append(message, adapters.data(), adapters.size() * sizeof(Hb_Adapter));
  append(message, networks.data(), networks.size() * sizeof(Hb_Network));
  return message;
}

}  // namespace

Buffer small_configuration() {
  constexpr uint32_t addresses = 0x0A000000;
  const std::vector<Hb_Adapter> adapters = {
      adapter_of(0, 0, addresses + 1),  adapter_of(1, 1, addresses + 2),    adapter_of(4, 0, addresses + 3),
      adapter_of(5, 1, addresses + 4),  adapter_of(9, 1, addresses + 5),    adapter_of(8, 0, addresses + 1),
      adapter_of(17, 3, addresses + 7), adapter_of(9000, 1, addresses + 8),
  };
  const std::vector<Hb_Network> networks = {network_of("service"), network_of("standby"), network_of(""),
                                            network_of("disk")};
  const hb_configuration_header header = {
      1, 6, 4, static_cast<int32_t>(adapters.size()), static_cast<int32_t>(networks.size()), {30, 0}, {20, 0}};
  return message_with(header, adapters, networks);
}

Buffer largest_configuration() {
  std::vector<Hb_Adapter> adapters;
  for (uint32_t number = 0; number < HB_MAX_ADAPTERS; ++number) {
    adapters.push_back(adapter_of(number, static_cast<Hb_Network_Number>(number % HB_MAX_NETWORKS), number));
  }
  const std::vector<Hb_Network> networks(HB_MAX_NETWORKS, network_of("net"));
  const hb_configuration_header header = {0,       HB_MAX_NODES, HB_MAX_NETWORKS, HB_MAX_ADAPTERS, HB_MAX_NETWORKS,
                                          {30, 0}, {20, 0}};
  return message_with(header, adapters, networks);
}

Buffer framed(int32_t kind, Bytes message) {
  const auto length = static_cast<int32_t>(HB_REPLY_HEADER_SIZE + message.size());
  Buffer frame;
  append(frame, &length, sizeof length);
  append(frame, &kind, sizeof kind);
  frame.resize(sizeof length + HB_REPLY_HEADER_SIZE);
  append(frame, message.data(), message.size());
  return frame;
}

void shrink_configuration(std::span<uint8_t> message) {
  constexpr int largest_limit = 512;
  constexpr int few_nodes = 25;
  constexpr int few_adapters = 20;
  if (!Configuration_Model::is_usable(message)) {
    return;
  }
  hb_configuration_header header;
  std::memcpy(&header, message.data(), sizeof header);
  // Nodes without adapters and the other way round count as well: both are walked over.
  if ((header.max_nodes + 1) * header.adapters_per_node > largest_limit || header.max_nodes > largest_limit) {
    header.max_nodes %= few_nodes;
    header.adapters_per_node = 1 + header.adapters_per_node % few_adapters;
  }
  std::memcpy(message.data(), &header, sizeof header);
}

}  // namespace fuzz
