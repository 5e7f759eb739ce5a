/* A client in bytes. */
#ifndef HB_TESTS_DAEMON_WIRE_H
#define HB_TESTS_DAEMON_WIRE_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

using Bytes = std::vector<std::uint8_t>;

/** Bytes written down field by field, little-endian. */
class ByteWriter {
 public:
  ByteWriter& u8(unsigned value);
  ByteWriter& u16(unsigned value);
  ByteWriter& u32(std::uint32_t value);
  ByteWriter& u64(std::uint64_t value);
  ByteWriter& zeros(std::size_t count);
  ByteWriter& raw(const Bytes& bytes);
  /** A text in a field of `size` bytes, filled with zeros. */
  ByteWriter& text(const std::string& text, std::size_t size);

  [[nodiscard]] Bytes bytes() const { return bytes_; }

 private:
  Bytes bytes_;
};

/** A packet as the daemon sends it, without the length before it. */
struct ExpectedPacket {
  std::uint32_t kind = 0;
  std::uint32_t leader = 0;
  std::uint32_t group_incarnation = 0;
  std::uint32_t group_status = 0;
  std::string name;
  std::uint32_t value = 0;
  std::string ffdc_id;
  std::uint32_t sequence = 0;
  Bytes message;

  [[nodiscard]] Bytes bytes() const;
};

/** A request packet with its length in front: 76 bytes of header, then the data. */
Bytes request(std::uint32_t code, const Bytes& data);

/** A request whose `len` is a number, followed by that many zero bytes. */
Bytes request_with_number(std::uint32_t code, std::uint32_t number);

/** What a subscription is of. */
enum class SubscriptionType : std::uint32_t {
  Node = 0,
  AllNodes = 1,
  Adapter = 2,
  AllAdapters = 3,
  Empty = 4,
  Network = 5,
  DifferentInstance = 6,
  Site = 7,
  AllSites = 8,
  SplitMerge = 9
};

/** The data of request 209: 12,348 bytes; `set` are the first bytes of the bit set. */
Bytes subscription(SubscriptionType type, std::uint32_t events, const std::string& name, const Bytes& set = {});

/** A 32-bit field of a packet. */
std::uint32_t field(const Bytes& packet, std::size_t offset);

/** A text of a packet, up to its terminator. */
std::string text_field(const Bytes& packet, std::size_t offset);

/** A connection to the daemon. */
class Connection {
 public:
  explicit Connection(const std::string& path);
  Connection(const Connection&) = delete;
  Connection& operator=(const Connection&) = delete;
  ~Connection();

  void send(const Bytes& bytes) const;
  /** The next packet, without its length; nothing at the end of the connection, or after 20 seconds. */
  std::optional<Bytes> receive();
  /** Subscribes to `events`. */
  void subscribe(SubscriptionType type, std::uint32_t events, const std::string& name, const Bytes& set = {}) const;
  /** Asks for the configuration and yields the answer: everything that was sent before it is done by then. */
  std::optional<Bytes> configuration();
  /** Whether the daemon ends the connection, what it sent before aside. */
  bool is_ended();
  /** Waits until the daemon has ended the connection, without reading. */
  [[nodiscard]] bool wait_until_ended() const;
  /** Whether nothing has arrived. */
  [[nodiscard]] bool is_quiet() const;

  [[nodiscard]] int descriptor() const { return socket_; }

 private:
  bool read_exactly(std::uint8_t* to, std::size_t size) const;

  int socket_;
};

#endif
