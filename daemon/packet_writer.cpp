#include "packet_writer.h"

#include <algorithm>
#include <cstring>
#include <string_view>

#include "hb_protocol/configuration_message.h"

namespace hbd {
namespace {

/* In a frame. */
constexpr std::size_t message_start = std::size_t{HB_FRAME_PREFIX_SIZE} + HB_REPLY_HEADER_SIZE;

/* One packet while it is written. */
class Packet {
 public:
  Packet(Hb_Client_Reply kind, std::size_t message_size) : bytes_(message_start + message_size) {
    put_at(0, static_cast<hb_frame_length>(HB_REPLY_HEADER_SIZE + message_size));
    put_header(offsetof(client_packet, kind), static_cast<std::int32_t>(kind));
  }

  template <typename Field>
  void put_header(std::size_t offset, const Field& field) {
    put_at(HB_FRAME_PREFIX_SIZE + offset, field);
  }

  /** Appends to the message. */
  template <typename Field>
  void put(const Field& field) {
    put_at(next_, field);
    next_ += sizeof(field);
  }

  void put_ffdc_id(std::string_view id) {
    const std::size_t length = std::min<std::size_t>(id.size(), HB_FFDC_ID_LENGTH - 1);
    std::copy_n(id.data(), length, bytes_.data() + HB_FRAME_PREFIX_SIZE + offsetof(client_packet, ffdc_id));
  }

  void put_group(std::uint32_t leader, Hb_Incarnation incarnation, Hb_Group_Status status) {
    put_header(offsetof(client_packet, leader_id), leader);
    put_header(offsetof(client_packet, group_id) + sizeof(std::uint32_t), incarnation);
    put_header(offsetof(client_packet, group_status), static_cast<std::int32_t>(status));
  }

  SharedFrame share() { return std::make_shared<const Frame>(std::move(bytes_)); }

 private:
  template <typename Field>
  void put_at(std::size_t offset, const Field& field) {
    std::memcpy(bytes_.data() + offset, &field, sizeof(field));
  }

  Frame bytes_;
  std::size_t next_ = message_start;
};

void put_adapter_group(Packet& packet, const Cluster& cluster, Hb_Group_Status status) {
  const auto leader = cluster.up_adapters().first();
  packet.put_group(leader ? static_cast<std::uint32_t>(*leader) : HB_NO_ADAPTER, cluster.adapter_group_incarnation(),
                   status);
}

void put_node_group(Packet& packet, const Cluster& cluster, Hb_Group_Status status) {
  const auto leader = cluster.up_nodes().first();
  packet.put_group(leader ? static_cast<std::uint32_t>(*leader) : UINT32_MAX, cluster.node_group_incarnation(), status);
}

void put_nodes(Packet& packet, const Cluster& cluster, const MemberSet& nodes) {
  for (int node = 0; node < cluster.configuration().max_nodes; ++node) {
    packet.put<std::int32_t>(nodes.contains(static_cast<std::size_t>(node)) ? Hb_True : Hb_False);
  }
}

std::size_t node_message_size(const Cluster& cluster) {
  return static_cast<std::size_t>(cluster.configuration().max_nodes) * sizeof(Hb_Boolean);
}

std::size_t adapter_message_size(std::size_t adapters) {
  return sizeof(hb_adapter_event_header) + adapters * sizeof(hb_adapter_event_entry);
}

template <std::size_t Size>
void copy_text(char (&field)[Size], const std::string& text) {
  std::copy_n(text.data(), std::min(text.size(), Size - 1), field);
}

void put_adapter(Packet& packet, const Adapter& adapter, bool up) {
  Hb_Adapter record{};
  record.Hb_ip_address = adapter.address;
  record.Hb_network = adapter.network;
  copy_text(record.Hb_adapter_type, adapter.type);
  record.Hb_adapter_num = adapter.number;
  record.Hb_state = up ? Hb_Entity_Up : Hb_Entity_Down;
  packet.put(record);
}

void put_network(Packet& packet, const Network& network) {
  Hb_Network record{};
  copy_text(record.Hb_network_name, network.name);
  copy_text(record.Hb_network_type, network.type);
  packet.put(record);
}

Packet configuration_packet(Hb_Client_Reply kind, const Cluster& cluster) {
  const Configuration& configuration = cluster.configuration();
  Packet packet(kind, sizeof(hb_configuration_header) + configuration.adapters.size() * sizeof(Hb_Adapter) +
                          configuration.networks.size() * sizeof(Hb_Network));
  hb_configuration_header header{};
  header.local_node_number = configuration.local_node;
  header.max_nodes = configuration.max_nodes;
  header.adapters_per_node = configuration.adapters_per_node;
  header.num_adapters = static_cast<std::int32_t>(configuration.adapters.size());
  header.num_networks = static_cast<std::int32_t>(configuration.networks.size());
  header.rem_node_down_sim_period = configuration.remote_node_down_period;
  header.local_node_down_sim_period = configuration.local_node_down_period;
  packet.put(header);
  for (const auto& [number, adapter] : configuration.adapters) {
    put_adapter(packet, adapter, cluster.up_adapters().contains(number) && cluster.has_address(number));
  }
  for (const auto& network : configuration.networks) {
    put_network(packet, network);
  }
  return packet;
}

Packet packet_of(const AdapterEvent& event, const Cluster& cluster) {
  Packet packet(event.direction == Direction::Death ? HB_ADAPTER_DEATH : HB_ADAPTER_JOIN,
                adapter_message_size(event.adapters.size()));
  put_adapter_group(packet, cluster, Hb_Group_Unstable);
  packet.put(hb_adapter_event_header{static_cast<std::int32_t>(event.adapters.size()) - 1});
  for (const auto& entry : event.adapters) {
    packet.put(entry);
  }
  return packet;
}

Packet packet_of(const NodeEvent& event, const Cluster& cluster) {
  Packet packet(event.direction == Direction::Death ? HB_NODE_DEATH : HB_NODE_JOIN, node_message_size(cluster));
  put_node_group(packet, cluster, Hb_Group_Unstable);
  packet.put_ffdc_id(event.ffdc_id);
  MemberSet nodes(static_cast<std::size_t>(cluster.configuration().max_nodes));
  for (const auto node : event.nodes) {
    nodes.add(static_cast<std::size_t>(node));
  }
  put_nodes(packet, cluster, nodes);
  return packet;
}

Packet packet_of(const AdapterGroupEvent& /*event*/, const Cluster& cluster) {
  std::vector<hb_adapter_event_entry> members;
  cluster.up_adapters().for_each([&](std::size_t number) {
    const auto adapter = static_cast<Hb_Adapter_Number>(number);
    members.push_back({adapter, cluster.incarnation(adapter)});
  });
  Packet packet(HB_ADAPTER_NEW_GROUP, adapter_message_size(members.size()));
  put_adapter_group(packet, cluster, Hb_Group_Stable);
  packet.put(hb_adapter_event_header{static_cast<std::int32_t>(members.size()) - 1});
  for (const auto& member : members) {
    packet.put(member);
  }
  return packet;
}

Packet packet_of(const NodeGroupEvent& /*event*/, const Cluster& cluster) {
  Packet packet(HB_NODE_NEW_GROUP, node_message_size(cluster));
  put_node_group(packet, cluster, Hb_Group_Stable);
  put_nodes(packet, cluster, cluster.up_nodes());
  return packet;
}

Packet packet_of(const ConfigurationEvent& /*event*/, const Cluster& cluster) {
  return configuration_packet(HB_CONFIGURATION_UPDATE, cluster);
}

Packet packet_of(const FailureData& event, const Cluster& /*cluster*/) {
  Packet packet(HB_FFDC_ID, 0);
  packet.put_ffdc_id(event.id);
  return packet;
}

Packet packet_of(const DifferentInstance& event, const Cluster& /*cluster*/) {
  Packet packet(HB_DIFF_INSTANCE_NUM, sizeof(event.address) + sizeof(event.instance));
  packet.put(event.address);
  packet.put(event.instance);
  return packet;
}

Packet packet_of(const HeartbeatSettings& event, const Cluster& /*cluster*/) {
  Packet packet(HB_NODE_HEARTBEAT, 4 * sizeof(std::int32_t));
  packet.put(event.seconds);
  packet.put(event.microseconds);
  packet.put<std::int32_t>(event.enabled ? Hb_True : Hb_False);
  packet.put(event.daemon_pid);
  return packet;
}

}  // namespace

SharedFrame event_frame(const Event& event, const Cluster& cluster) {
  Packet packet = std::visit([&](const auto& body) { return packet_of(body, cluster); }, event.body);
  packet.put_header(offsetof(client_packet, notification_sequence_no), event.sequence);
  return packet.share();
}

SharedFrame configuration_frame(const Cluster& cluster) {
  return configuration_packet(HB_CONFIGURATION_INFO, cluster).share();
}

SharedFrame answer_frame(Hb_Client_Reply kind, std::int32_t value) {
  Packet packet(kind, 0);
  packet.put_header(offsetof(client_packet, value), value);
  return packet.share();
}

SharedFrame state_frame(std::int32_t status, Hb_Adapter_state_t state) {
  Packet packet(HB_ADAPTER_STATE, sizeof(state));
  packet.put_header(offsetof(client_packet, value), status);
  packet.put(static_cast<std::int32_t>(state));
  return packet.share();
}

SharedFrame route_frame(std::uint16_t length, const Hb_Source_Route& hops) {
  Packet packet(HB_ROUTE, sizeof(hops));
  packet.put_header(offsetof(client_packet, value), std::int32_t{length});
  packet.put(hops);
  return packet.share();
}

}  // namespace hbd
