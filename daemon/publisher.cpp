#include "publisher.h"

#include <spdlog/spdlog.h>

#include <cstring>

namespace hbd {
namespace {

constexpr std::chrono::milliseconds retry_interval{1};
constexpr std::chrono::milliseconds long_wait{1000};

/* Everybody may learn what is there; routes and keys are for the daemon's user and group. Readers change semaphores. */
constexpr int open_mode = 0644;
constexpr int guarded_mode = 0640;
constexpr int semaphore_mode = 0666;

}  // namespace

Publisher::Publisher(Loop& loop, const std::string& path, const memory_configuration_data& configuration)
    : loop_(loop),
      semaphores_(object_key(path, HB_SEMAPHORE_SET_ID), HB_SEMAPHORE_COUNT, semaphore_mode),
      configuration_(object_key(path, HB_CONFIGURATION_SEGMENT_ID), sizeof(memory_configuration_data), open_mode),
      routes_(object_key(path, HB_ROUTE_SEGMENT_ID), configuration.number_of_nodes * sizeof(route_sequence),
              guarded_mode),
      security_(object_key(path, HB_SECURITY_SEGMENT_ID), sizeof(security_information), guarded_mode),
      retry_(loop, [this] { try_to_write(); }) {
  publish(configuration);
}

void Publisher::publish(const memory_configuration_data& configuration) {
  const bool inside = is_waiting();
  next_ = configuration;
  if (!inside) {
    semaphores_.add(HB_WRITER_SEMAPHORE, 1);
    waiting_since_ = loop_.now();
    try_to_write();
  }
}

void Publisher::try_to_write() {
  if (!semaphores_.is_zero(HB_READERS_SEMAPHORE)) {
    wait_for_readers();
    return;
  }
  std::memcpy(configuration_.data(), &*next_, sizeof(*next_));
  next_.reset();
  complained_ = false;
  semaphores_.add(HB_WRITER_SEMAPHORE, -1);
}

void Publisher::wait_for_readers() {
  if (!complained_ && loop_.now() - waiting_since_ >= long_wait) {
    spdlog::warn("a reader has been inside the shared segments for {} ms; the update waits for it",
                 (loop_.now() - waiting_since_).count());
    complained_ = true;
  }
  retry_.start(retry_interval);
}

}  // namespace hbd
