#include "publisher.h"

#include <spdlog/spdlog.h>
#include <strings.h>

#include <algorithm>
#include <atomic>
#include <cstring>
#include <utility>

namespace hbd {
namespace {

constexpr std::chrono::milliseconds retry_interval{1};

/* Everybody may learn what is there; the rest is for the daemon's user and group. Readers have to change semaphores. */
constexpr int open_mode = 0644;
constexpr int guarded_mode = 0640;
constexpr int semaphore_mode = 0660;

/* While it is 0 nothing beside it is valid. So nobody takes what a daemon has left that was killed while it wrote. */
void set_number(Hb_Sequence_Number& number, Hb_Sequence_Number value) {
  std::atomic_ref(number).exchange(value, std::memory_order_acq_rel);
}

}  // namespace

Publisher::Publisher(Loop& loop, const std::string& path, Publication publication, std::chrono::milliseconds patience)
    : loop_(loop),
      patience_(patience),
      semaphores_(object_key(path, HB_SEMAPHORE_SET_ID), HB_SEMAPHORE_COUNT, semaphore_mode),
      configuration_(object_key(path, HB_CONFIGURATION_SEGMENT_ID), sizeof(memory_configuration_data), open_mode),
      routes_(object_key(path, HB_ROUTE_SEGMENT_ID), publication.configuration.number_of_nodes * sizeof(route_sequence),
              guarded_mode),
      security_(object_key(path, HB_SECURITY_SEGMENT_ID), sizeof(security_information), guarded_mode),
      nodes_(publication.configuration.number_of_nodes),
      retry_(loop, [this] { try_to_write(); }) {
  publish(std::move(publication));
}

/* Processes that are still attached keep the memory, without the keys. */
Publisher::~Publisher() { explicit_bzero(security_.data(), sizeof(security_information)); }

void Publisher::publish(Publication publication) {
  const bool is_first = !is_waiting();
  next_ = std::move(publication);
  request_write(is_first);
}

void Publisher::publish(const security_information& keys) {
  const bool is_first = !is_waiting();
  next_keys_ = &keys;
  request_write(is_first);
}

void Publisher::request_write(bool is_first) {
  if (is_first) {
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
  if (const auto publication = std::exchange(next_, std::nullopt)) {
    write(*publication);
  }
  if (const auto* keys = std::exchange(next_keys_, nullptr)) {
    write(*keys);
  }
  complained_ = false;
  semaphores_.add(HB_WRITER_SEMAPHORE, -1);
}

void Publisher::write(const Publication& publication) const {
  auto& configuration = *static_cast<memory_configuration_data*>(configuration_.data());
  auto* routes = static_cast<route_sequence*>(routes_.data());
  set_number(configuration.sequence_number, 0);
  const std::size_t count = std::min(nodes_, publication.routes.size());
  std::copy_n(publication.routes.begin(), count, routes);
  std::fill(routes + count, routes + nodes_, route_sequence{});
  configuration.number_of_nodes = publication.configuration.number_of_nodes;
  configuration.number_of_adapters = publication.configuration.number_of_adapters;
  set_number(configuration.sequence_number, publication.configuration.sequence_number);
}

void Publisher::write(const security_information& keys) const {
  auto& security = *static_cast<security_information*>(security_.data());
  set_number(security.sequence_number, 0);
  security.previous_sec_status = keys.previous_sec_status;
  security.current_sec_status = keys.current_sec_status;
  security.cache = keys.cache;
  set_number(security.sequence_number, keys.sequence_number);
}

void Publisher::wait_for_readers() {
  const auto waited = loop_.now() - waiting_since_;
  if (!complained_ && waited >= patience_) {
    spdlog::warn(
        "a reader has been inside the shared segments for {} ms, process {} if nobody else came or went since; "
        "the update waits for it",
        waited.count(), semaphores_.last_process(HB_READERS_SEMAPHORE));
    complained_ = true;
  }
  retry_.start(retry_interval);
}

}  // namespace hbd
