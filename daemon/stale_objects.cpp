#include "stale_objects.h"

#include <spdlog/spdlog.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>

#include <array>
#include <cerrno>
#include <csignal>

#include "hb_protocol/shared_memory.h"
#include "ipc_objects.h"

namespace hbd {
namespace {

/* A segment has a whole number of units, or exactly one. */
struct Shape {
  int project;
  std::size_t unit;
  bool many;
};

constexpr std::array<Shape, 3> shapes = {{
    {HB_CONFIGURATION_SEGMENT_ID, sizeof(memory_configuration_data), false},
    {HB_ROUTE_SEGMENT_ID, sizeof(route_sequence), true},
    {HB_SECURITY_SEGMENT_ID, sizeof(security_information), false},
}};

/* Ids of other process namespaces read as 0: they count as alive. */
bool process_is_gone(pid_t process) { return process > 0 && kill(process, 0) != 0 && errno == ESRCH; }

bool has_shape(const shmid_ds& segment, const Shape& shape) {
  return shape.many ? segment.shm_segsz % shape.unit == 0 : segment.shm_segsz == shape.unit;
}

enum class Found { Nothing, Removed, Foreign };

Found remove_stale_segment(const std::string& path, const Shape& shape) {
  const int id = shmget(object_key(path, shape.project), 0, 0);
  shmid_ds segment{};
  if (id == -1 || shmctl(id, IPC_STAT, &segment) != 0) {
    return errno == ENOENT ? Found::Nothing : Found::Foreign;
  }
  if (!has_shape(segment, shape) || !process_is_gone(segment.shm_cpid)) {
    return Found::Foreign;
  }
  /* Processes that are still attached keep their memory. */
  if (shmctl(id, IPC_RMID, nullptr) != 0) {
    return Found::Foreign;
  }
  spdlog::info("removed the shared segment {} that process {} left behind", id, segment.shm_cpid);
  return Found::Removed;
}

/* A set does not tell its maker: it goes with a segment, or when all who ever touched it are gone. */
bool set_is_stale(int id, bool maker_is_gone) {
  semid_ds set{};
  if (semctl(id, 0, IPC_STAT, &set) != 0 || set.sem_nsems != HB_SEMAPHORE_COUNT) {
    return false;
  }
  return maker_is_gone || (process_is_gone(semctl(id, HB_READERS_SEMAPHORE, GETPID)) &&
                           process_is_gone(semctl(id, HB_WRITER_SEMAPHORE, GETPID)));
}

void remove_stale_semaphores(const std::string& path, bool maker_is_gone) {
  const int id = semget(object_key(path, HB_SEMAPHORE_SET_ID), 0, 0);
  if (id != -1 && set_is_stale(id, maker_is_gone) && semctl(id, 0, IPC_RMID) == 0) {
    spdlog::info("removed the semaphore set {} that was left behind", id);
  }
}

}  // namespace

void remove_stale_objects(const std::string& path) {
  bool removed = false;
  bool foreign = false;
  for (const Shape& shape : shapes) {
    const Found found = remove_stale_segment(path, shape);
    removed = removed || found == Found::Removed;
    foreign = foreign || found == Found::Foreign;
  }
  if (!foreign) {
    remove_stale_semaphores(path, removed);
  }
}

}  // namespace hbd
