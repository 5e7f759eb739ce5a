/* What the daemon publishes in shared memory, and the writer's side of the reader lock. */
#ifndef HBD_PUBLISHER_H
#define HBD_PUBLISHER_H

#include <optional>
#include <string>

#include "hb_protocol/shared_memory.h"
#include "ipc_objects.h"
#include "loop.h"

namespace hbd {

/** The three segments and the semaphore set of one socket path. */
class Publisher {
 public:
  /**
   * Makes the objects, with the configuration in them and neither routes nor keys.
   *
   * @throws KeyTaken when one of the keys is in use, Failure when an object cannot be made.
   */
  Publisher(Loop& loop, const std::string& path, const memory_configuration_data& configuration);

  /**
   * Replaces the published configuration once no reader is inside. New readers wait meanwhile; this call does not.
   * A second call before that replaces what is to be published.
   */
  void publish(const memory_configuration_data& configuration);

  /** Whether a publication waits for readers to leave. */
  [[nodiscard]] bool is_waiting() const { return next_.has_value(); }

 private:
  void try_to_write();
  void wait_for_readers();

  Loop& loop_;
  SemaphoreSet semaphores_;
  SharedSegment configuration_;
  SharedSegment routes_;
  SharedSegment security_;
  std::optional<memory_configuration_data> next_;
  std::chrono::milliseconds waiting_since_{};
  bool complained_ = false;
  Timer retry_;
};

}  // namespace hbd

#endif
