/* What the daemon publishes in shared memory, and the writer's side of the reader lock. */
#ifndef HBD_PUBLISHER_H
#define HBD_PUBLISHER_H

#include <optional>
#include <string>
#include <vector>

#include "hb_protocol/shared_memory.h"
#include "ipc_objects.h"
#include "loop.h"

namespace hbd {

/** A configuration, and the routes that were made for it. */
struct Publication {
  memory_configuration_data configuration{};
  std::vector<route_sequence> routes; /**< by node number; those that are left out are none */
};

/** The three segments and the semaphore set of one socket path. */
class Publisher {
 public:
  /**
   * Makes the objects, with the configuration and the routes in them and no keys.
   *
   * @param patience a reader that is inside for longer is reported.
   * @throws KeyTaken when one of the keys is in use, Failure when an object cannot be made.
   */
  Publisher(Loop& loop, const std::string& path, Publication publication, std::chrono::milliseconds patience);
  Publisher(const Publisher&) = delete;
  Publisher& operator=(const Publisher&) = delete;
  ~Publisher();

  /**
   * Replaces the published configuration and its routes once no reader is inside. New readers wait meanwhile; this call
   * does not. A second call before that replaces what is to be published.
   */
  void publish(Publication publication);

  /** Replaces the published keys in the same way. They have to stay where they are until then. */
  void publish(const security_information& keys);

  /** Whether a publication waits for readers to leave. */
  [[nodiscard]] bool is_waiting() const { return next_.has_value() || next_keys_ != nullptr; }

 private:
  void request_write(bool is_first);
  void try_to_write();
  void wait_for_readers();
  void write(const Publication& publication) const;
  void write(const security_information& keys) const;

  Loop& loop_;
  std::chrono::milliseconds patience_;
  SemaphoreSet semaphores_;
  SharedSegment configuration_;
  SharedSegment routes_;
  SharedSegment security_;
  std::size_t nodes_;
  std::optional<Publication> next_;
  const security_information* next_keys_ = nullptr;
  std::chrono::milliseconds waiting_since_{};
  bool complained_ = false;
  Timer retry_;
};

}  // namespace hbd

#endif
