// The daemon's side, played in bytes: it listens on a local socket, publishes the System V objects and holds the
// conversations that a test scripts.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <exception>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <utility>

#include "support/bytes.h"
#include "support/temporary_directory.h"

namespace hb_test {

// Ends all waiting of a daemon and of its connections.
class StopSignal {
 public:
  StopSignal();
  ~StopSignal();
  StopSignal(const StopSignal&) = delete;
  StopSignal& operator=(const StopSignal&) = delete;

  void raise() noexcept;
  // Readable from then on.
  int descriptor() const { return descriptor_; }

 private:
  int descriptor_;
};

// One connection of a client, as the daemon sees it. Waits at most ten seconds for bytes, or until the daemon is
// destroyed, then throws.
class DaemonConnection {
 public:
  DaemonConnection() = default;
  DaemonConnection(int descriptor, std::shared_ptr<const StopSignal> stop)
      : descriptor_(descriptor), stop_(std::move(stop)) {}
  ~DaemonConnection() { close(); }
  DaemonConnection(DaemonConnection&& other) noexcept;
  DaemonConnection& operator=(DaemonConnection&& other) noexcept;

  int descriptor() const { return descriptor_; }
  bool is_open() const { return descriptor_ >= 0; }

  // The next framed packet without its length. Throws at the end of the stream.
  Bytes receive_request();
  // Exactly so many bytes of the stream.
  Bytes receive_raw(size_t count);
  // Whether bytes or the end of the stream are waiting.
  bool has_input() const;
  // Waits for the end of the stream; false when bytes come instead.
  bool at_end();

  void send_raw(std::string_view bytes);
  void send_frame(const Bytes& packet) { send_raw(framed(packet)); }
  // Each byte in a write of its own.
  void send_byte_by_byte(std::string_view bytes);

  void close();

 private:
  Bytes receive_up_to(size_t count);

  int descriptor_ = -1;
  std::shared_ptr<const StopSignal> stop_;
};

// What the daemon publishes. Whatever is left out does not exist.
struct Publication {
  bool configuration_segment = true;
  bool route_segment = true;
  bool security_segment = true;
  bool semaphores = true;
  uint32_t sequence_number = 1;  // first word of the configuration segment
  uint32_t nodes = 3;            // its second word
  uint32_t adapters = 6;         // its third word
  size_t configuration_size = 12;
  size_t route_size = 3 * 184;  // follows `nodes` when it is changed through for_nodes()
  size_t security_size = 3168;
  int semaphore_count = 2;
  int permissions = 0600;

  static Publication none();
  static Publication for_nodes(uint32_t count);
};

enum class Segment { configuration = 0, route = 1, security = 2 };

class FakeDaemon {
 public:
  // Listens in a directory of its own, publishes, and points the library there through the environment.
  explicit FakeDaemon(const Publication& publication = Publication());
  // Ends the script, closes everything and removes what was published.
  ~FakeDaemon();
  FakeDaemon(const FakeDaemon&) = delete;
  FakeDaemon& operator=(const FakeDaemon&) = delete;

  const std::string& path() const { return path_; }
  const std::string& directory() const { return directory_.path(); }

  // The next client. Waits at most ten seconds, then throws.
  DaemonConnection accept();
  // Whether a client waits to be accepted.
  bool has_client() const;

  // Runs the script on a thread of its own.
  void run(std::function<void(FakeDaemon&)> script);
  // Waits for the script; throws what it threw.
  void join();

  // On a thread: takes a client, awaits the configuration request (201) and answers it with that packet.
  void serve_configuration(const Bytes& answer);
  // Waits for serve_configuration() and hands over the connection that it took.
  DaemonConnection take_connection();

  // No client is taken any more; the socket's file stays, as it is the key path of what is published.
  void stop_listening();

  int segment_id(Segment segment) const { return segment_ids_[static_cast<size_t>(segment)]; }
  int semaphore_id() const { return semaphore_id_; }
  void write_segment(Segment segment, size_t offset, std::string_view bytes);
  Bytes read_segment(Segment segment);
  void remove_segment(Segment segment);
  void remove_semaphores();
  // Processes that have it attached.
  int attachments(Segment segment) const;

 private:
  void listen_and_publish();
  bool listen_at(const std::string& name);
  bool publish();
  bool publish_segment(Segment segment, int project, bool wanted, size_t size);
  bool publish_semaphores();
  void fill_configuration_segment();
  void withdraw();

  Publication publication_;
  TemporaryDirectory directory_;
  std::string path_;
  std::shared_ptr<StopSignal> stop_ = std::make_shared<StopSignal>();
  int listener_ = -1;
  int segment_ids_[3] = {-1, -1, -1};
  int semaphore_id_ = -1;
  std::thread thread_;
  std::exception_ptr failure_;
  DaemonConnection served_;
};

}  // namespace hb_test
