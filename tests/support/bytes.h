// Packets of the daemon, written field by field at the offsets of the wire.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace hb_test {

using Bytes = std::string;

// Appends fields in host byte order.
class ByteBuilder {
 public:
  ByteBuilder& u8(uint8_t value);
  ByteBuilder& u16(uint16_t value);
  ByteBuilder& i16(int16_t value) { return u16(static_cast<uint16_t>(value)); }
  ByteBuilder& u32(uint32_t value);
  ByteBuilder& i32(int32_t value) { return u32(static_cast<uint32_t>(value)); }
  ByteBuilder& u64(uint64_t value);
  ByteBuilder& zeros(size_t count);
  ByteBuilder& raw(std::string_view bytes);
  // The text, cut at width, filled up with zeros. A text as long as width has no terminator.
  ByteBuilder& text(std::string_view text, size_t width);

  const Bytes& bytes() const { return bytes_; }

 private:
  Bytes bytes_;
};

// Fields of a packet that was read.
uint16_t u16_at(const Bytes& bytes, size_t offset);
uint32_t u32_at(const Bytes& bytes, size_t offset);
int32_t i32_at(const Bytes& bytes, size_t offset);
uint64_t u64_at(const Bytes& bytes, size_t offset);

// The 4-byte length and the packet.
Bytes framed(const Bytes& packet);

// "10.1.2.3" as the 16 bytes of its IPv4-mapped address, or an IPv6 text as its 16 bytes.
Bytes address_bytes(const std::string& text);

// A packet of the daemon: 108 bytes of header and a message.
class ReplyPacket {
 public:
  explicit ReplyPacket(int32_t kind);

  ReplyPacket& leader(uint32_t word0, uint32_t word1);
  ReplyPacket& group(uint32_t word0, uint32_t word1);
  ReplyPacket& status(int32_t group_status);
  ReplyPacket& name(std::string_view subscription_name);
  ReplyPacket& value(int32_t value);
  ReplyPacket& ffdc(std::string_view failure_data_identifier);
  ReplyPacket& sequence(uint32_t number);
  ReplyPacket& message(const Bytes& message);

  Bytes bytes() const { return header_ + message_; }

 private:
  ReplyPacket& put(size_t offset, const Bytes& field);

  Bytes header_;
  Bytes message_;
};

// The message of kinds 2, 3 and 4: last index, then adapter number and incarnation of each entry.
struct AdapterEntry {
  uint32_t adapter;
  uint32_t incarnation;
};
Bytes adapter_event_message(const std::vector<AdapterEntry>& entries);

// The message of kinds 5, 6 and 7: one 32-bit flag a node number.
Bytes node_event_message(const std::vector<uint32_t>& flags);

// The message of kinds 0 and 9: 52 bytes of header, 64 an adapter, 86 a network. The counts are those of what was
// added unless they are overridden.
class ConfigurationMessage {
 public:
  ConfigurationMessage& local_node(int32_t number);
  ConfigurationMessage& max_nodes(int32_t count);
  ConfigurationMessage& adapters_per_node(int32_t count);
  ConfigurationMessage& remote_period(uint64_t seconds, uint64_t microseconds);
  ConfigurationMessage& local_period(uint64_t seconds, uint64_t microseconds);
  ConfigurationMessage& adapter(uint32_t number, const std::string& address, int16_t network = 0,
                                std::string_view type = "ether", int32_t state = 0);
  ConfigurationMessage& network(std::string_view name, std::string_view type = "ether");
  ConfigurationMessage& claim_adapters(int32_t count);
  ConfigurationMessage& claim_networks(int32_t count);

  Bytes bytes() const;

 private:
  int32_t local_node_ = 0;
  int32_t max_nodes_ = 0;
  int32_t adapters_per_node_ = 0;
  uint64_t periods_[4] = {};
  int32_t adapter_count_ = 0;
  int32_t network_count_ = 0;
  Bytes adapters_;
  Bytes networks_;
};

// Three nodes of two adapters on two networks, this process on node 0: adapter a has the address 10.0.0.(a + 1) and
// network a mod 2; the networks are named "net0" and "net1".
ConfigurationMessage small_cluster();

// The answer of kind 0 with that message.
Bytes configuration_answer(const ConfigurationMessage& configuration);

}  // namespace hb_test
