#include "support/bytes.h"

#include <arpa/inet.h>

#include <cstring>
#include <stdexcept>

namespace hb_test {

namespace {

template <typename T>
T value_at(const Bytes& bytes, size_t offset) {
  if (offset + sizeof(T) > bytes.size()) {
    throw std::out_of_range("a field beyond the end of the packet");
  }
  T value;
  std::memcpy(&value, bytes.data() + offset, sizeof value);
  return value;
}

template <typename T>
void append(Bytes& bytes, T value) {
  bytes.append(reinterpret_cast<const char*>(&value), sizeof value);
}

}  // namespace

ByteBuilder& ByteBuilder::u8(uint8_t value) {
  append(bytes_, value);
  return *this;
}

ByteBuilder& ByteBuilder::u16(uint16_t value) {
  append(bytes_, value);
  return *this;
}

ByteBuilder& ByteBuilder::u32(uint32_t value) {
  append(bytes_, value);
  return *this;
}

ByteBuilder& ByteBuilder::u64(uint64_t value) {
  append(bytes_, value);
  return *this;
}

ByteBuilder& ByteBuilder::zeros(size_t count) {
  bytes_.append(count, '\0');
  return *this;
}

ByteBuilder& ByteBuilder::raw(std::string_view bytes) {
  bytes_.append(bytes);
  return *this;
}

ByteBuilder& ByteBuilder::text(std::string_view text, size_t width) {
  const std::string_view kept = text.substr(0, width);
  return raw(kept).zeros(width - kept.size());
}

uint16_t u16_at(const Bytes& bytes, size_t offset) { return value_at<uint16_t>(bytes, offset); }
uint32_t u32_at(const Bytes& bytes, size_t offset) { return value_at<uint32_t>(bytes, offset); }
int32_t i32_at(const Bytes& bytes, size_t offset) { return value_at<int32_t>(bytes, offset); }
uint64_t u64_at(const Bytes& bytes, size_t offset) { return value_at<uint64_t>(bytes, offset); }

Bytes framed(const Bytes& packet) {
  return ByteBuilder().u32(static_cast<uint32_t>(packet.size())).raw(packet).bytes();
}

Bytes address_bytes(const std::string& text) {
  char address[16] = {};
  if (inet_pton(AF_INET6, text.c_str(), address) == 1) {
    return Bytes(address, sizeof address);
  }
  address[10] = address[11] = '\xff';
  if (inet_pton(AF_INET, text.c_str(), address + 12) == 1) {
    return Bytes(address, sizeof address);
  }
  throw std::invalid_argument("no address: " + text);
}

ReplyPacket::ReplyPacket(int32_t kind) : header_(108, '\0') { put(0, ByteBuilder().i32(kind).bytes()); }

ReplyPacket& ReplyPacket::put(size_t offset, const Bytes& field) {
  header_.replace(offset, field.size(), field);
  return *this;
}

ReplyPacket& ReplyPacket::leader(uint32_t word0, uint32_t word1) {
  return put(4, ByteBuilder().u32(word0).u32(word1).bytes());
}

ReplyPacket& ReplyPacket::group(uint32_t word0, uint32_t word1) {
  return put(12, ByteBuilder().u32(word0).u32(word1).bytes());
}

ReplyPacket& ReplyPacket::status(int32_t group_status) { return put(20, ByteBuilder().i32(group_status).bytes()); }

ReplyPacket& ReplyPacket::name(std::string_view subscription_name) {
  return put(24, ByteBuilder().text(subscription_name, 32).bytes());
}

ReplyPacket& ReplyPacket::value(int32_t value) { return put(56, ByteBuilder().i32(value).bytes()); }

ReplyPacket& ReplyPacket::ffdc(std::string_view failure_data_identifier) {
  return put(60, ByteBuilder().text(failure_data_identifier, 43).bytes());
}

ReplyPacket& ReplyPacket::sequence(uint32_t number) { return put(104, ByteBuilder().u32(number).bytes()); }

ReplyPacket& ReplyPacket::message(const Bytes& message) {
  message_ = message;
  return *this;
}

Bytes adapter_event_message(const std::vector<AdapterEntry>& entries) {
  ByteBuilder builder;
  builder.i32(static_cast<int32_t>(entries.size()) - 1);
  for (const AdapterEntry& entry : entries) {
    builder.u32(entry.adapter).u32(entry.incarnation);
  }
  return builder.bytes();
}

Bytes node_event_message(const std::vector<uint32_t>& flags) {
  ByteBuilder builder;
  for (const uint32_t flag : flags) {
    builder.u32(flag);
  }
  return builder.bytes();
}

ConfigurationMessage& ConfigurationMessage::local_node(int32_t number) {
  local_node_ = number;
  return *this;
}

ConfigurationMessage& ConfigurationMessage::max_nodes(int32_t count) {
  max_nodes_ = count;
  return *this;
}

ConfigurationMessage& ConfigurationMessage::adapters_per_node(int32_t count) {
  adapters_per_node_ = count;
  return *this;
}

ConfigurationMessage& ConfigurationMessage::remote_period(uint64_t seconds, uint64_t microseconds) {
  periods_[0] = seconds;
  periods_[1] = microseconds;
  return *this;
}

ConfigurationMessage& ConfigurationMessage::local_period(uint64_t seconds, uint64_t microseconds) {
  periods_[2] = seconds;
  periods_[3] = microseconds;
  return *this;
}

ConfigurationMessage& ConfigurationMessage::adapter(uint32_t number, const std::string& address, int16_t network,
                                                    std::string_view type, int32_t state) {
  ByteBuilder record;
  record.raw(address_bytes(address)).i16(network).text(type, 36).zeros(2).u32(number).i32(state);
  adapters_ += record.bytes();
  ++adapter_count_;
  return *this;
}

ConfigurationMessage& ConfigurationMessage::network(std::string_view name, std::string_view type) {
  networks_ += ByteBuilder().text(name, 70).text(type, 16).bytes();
  ++network_count_;
  return *this;
}

ConfigurationMessage& ConfigurationMessage::claim_adapters(int32_t count) {
  adapter_count_ = count;
  return *this;
}

ConfigurationMessage& ConfigurationMessage::claim_networks(int32_t count) {
  network_count_ = count;
  return *this;
}

Bytes ConfigurationMessage::bytes() const {
  ByteBuilder builder;
  builder.i32(local_node_).i32(max_nodes_).i32(adapters_per_node_).i32(adapter_count_).i32(network_count_);
  for (const uint64_t field : periods_) {
    builder.u64(field);
  }
  return builder.raw(adapters_).raw(networks_).bytes();
}

ConfigurationMessage small_cluster() {
  ConfigurationMessage configuration;
  configuration.local_node(0).max_nodes(3).adapters_per_node(2).network("net0").network("net1");
  for (uint32_t adapter = 0; adapter < 6; ++adapter) {
    configuration.adapter(adapter, "10.0.0." + std::to_string(adapter + 1), static_cast<int16_t>(adapter % 2));
  }
  return configuration;
}

Bytes configuration_answer(const ConfigurationMessage& configuration) {
  return ReplyPacket(0).message(configuration.bytes()).bytes();
}

}  // namespace hb_test
