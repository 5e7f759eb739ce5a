#include "cluster.h"

#include <arpa/inet.h>

#include <algorithm>
#include <cstring>
#include <numeric>
#include <random>
#include <string>
#include <string_view>

#include "hb_protocol/framing.h"

namespace bench {
namespace {

constexpr uint32_t first_address = 10U << 24;  // 10.0.0.0

// Follows every number by another one, all of them in one random cycle.
std::vector<uint32_t> random_cycle(size_t length) {
  std::vector<uint32_t> next(length);
  std::iota(next.begin(), next.end(), 0U);
  std::mt19937 random(20260101);
  for (size_t last = length - 1; last > 0; --last) {
    std::swap(next[last], next[random() % last]);
  }
  return next;
}

// Into a field of zeros, whose last one stays.
void put_text(char* field, size_t size, std::string_view text) { text.copy(field, size - 1); }

Hb_Adapter adapter_record(const Cluster& cluster, uint32_t number, uint32_t number_in_its_address) {
  const auto slot = static_cast<int>(number) % cluster.adapters_per_node;
  Hb_Adapter adapter{};
  adapter.Hb_ip_address = address_with_number(number_in_its_address);
  adapter.Hb_network = static_cast<Hb_Network_Number>(slot);
  put_text(adapter.Hb_adapter_type, sizeof adapter.Hb_adapter_type, "en" + std::to_string(slot));
  adapter.Hb_adapter_num = number;
  adapter.Hb_state = Hb_Entity_Up;
  return adapter;
}

Hb_Network network_record(int number) {
  Hb_Network network{};
  put_text(network.Hb_network_name, sizeof network.Hb_network_name, "net" + std::to_string(number));
  put_text(network.Hb_network_type, sizeof network.Hb_network_type, "ether");
  return network;
}

hb_configuration_header configuration_header(const Cluster& cluster) {
  hb_configuration_header header{};
  header.max_nodes = cluster.nodes;
  header.adapters_per_node = cluster.adapters_per_node;
  header.num_adapters = cluster.adapters();
  header.num_networks = cluster.adapters_per_node;
  return header;
}

template <typename Record>
void append(Bytes& bytes, const Record& record) {
  const auto* first = reinterpret_cast<const char*>(&record);
  bytes.insert(bytes.end(), first, first + sizeof record);
}

}  // namespace

Hb_IP_address6 address_with_number(uint32_t number) {
  Hb_IP_address6 address{};
  address.v4_in_v6.filler[2] = htonl(0xFFFF);
  address.v4_in_v6.v4_in_v6_ipv4 = htonl(first_address + number);
  return address;
}

uint32_t number_in_address(const Hb_IP_address6& address) {
  return ntohl(address.v4_in_v6.v4_in_v6_ipv4) - first_address;
}

Bytes packet(Hb_Client_Reply kind, size_t message_size) {
  Bytes bytes(HB_REPLY_HEADER_SIZE + message_size);
  const int32_t code = kind;
  std::memcpy(bytes.data() + offsetof(client_packet, kind), &code, sizeof code);
  put_text(bytes.data() + offsetof(client_packet, subscription_name), sizeof(Hb_Name), "benchmark");
  return bytes;
}

Bytes configuration(Hb_Client_Reply kind, const Cluster& cluster) {
  Bytes bytes = packet(kind, 0);
  append(bytes, configuration_header(cluster));
  const auto next = random_cycle(static_cast<size_t>(cluster.adapters()));
  for (uint32_t number = 0; number < next.size(); ++number) {
    append(bytes, adapter_record(cluster, number, next[number]));
  }
  for (int number = 0; number < cluster.adapters_per_node; ++number) append(bytes, network_record(number));
  return bytes;
}

Bytes adapter_event(Hb_Client_Reply kind, size_t count, size_t step) {
  Bytes bytes = packet(kind, 0);
  append(bytes, hb_adapter_event_header{static_cast<int32_t>(count) - 1});
  for (size_t entry = 0; entry < count; ++entry) {
    append(bytes, hb_adapter_event_entry{static_cast<Hb_Adapter_Number>(entry * step), 7});
  }
  return bytes;
}

Bytes node_event(Hb_Client_Reply kind, const Cluster& cluster, int step) {
  Bytes bytes = packet(kind, 0);
  for (int node = 0; node < cluster.nodes; ++node) append(bytes, node % step == 0 ? Hb_True : Hb_False);
  return bytes;
}

Bytes failure_data_event(size_t message_size) {
  Bytes bytes = packet(HB_FFDC_ID, message_size);
  put_text(bytes.data() + offsetof(client_packet, ffdc_id), sizeof(fc_eid_t), "failure-data identifier of this event");
  return bytes;
}

Bytes framed(const Bytes& packet) {
  const auto length = static_cast<hb_frame_length>(packet.size());
  Bytes bytes(HB_FRAME_PREFIX_SIZE + packet.size());
  std::memcpy(bytes.data(), &length, sizeof length);
  std::copy(packet.begin(), packet.end(), bytes.begin() + HB_FRAME_PREFIX_SIZE);
  return bytes;
}

}  // namespace bench
