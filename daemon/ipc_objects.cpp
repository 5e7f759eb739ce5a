#include "ipc_objects.h"

#include <fmt/format.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace hbd {
namespace {

/* The last argument of semctl(), which no header declares. */
union SemaphoreArgument {
  int value;
  unsigned short* values;
};

[[noreturn]] void fail_to_make(std::string_view what, key_t key, std::size_t size) {
  const int reason = errno;
  if (reason == EEXIST) {
    throw KeyTaken(
        fmt::format("the key {:#x} of a {} is in use; see ipcs, and ipcrm for what is left over", key, what));
  }
  throw Failure(fmt::format("making a {} of {} (key {:#x}) failed: {}; see ipcs -l for the limits", what, size, key,
                            std::strerror(reason)));
}

}  // namespace

key_t object_key(const std::string& path, int project) {
  const key_t key = ftok(path.c_str(), project);
  if (key == -1) {
    throw Failure(fmt::format("no key for {}: {}; is the socket file being removed?", path, std::strerror(errno)));
  }
  return key;
}

SharedSegment::SharedSegment(key_t key, std::size_t size, int mode)
    : id_(shmget(key, size, IPC_CREAT | IPC_EXCL | mode)), data_(nullptr) {
  if (id_ == -1) {
    fail_to_make("shared segment", key, size);
  }
  data_ = shmat(id_, nullptr, 0);
  if (reinterpret_cast<std::intptr_t>(data_) == -1) {
    const int reason = errno;
    shmctl(id_, IPC_RMID, nullptr);
    errno = reason;
    fail_to_make("attachment of a shared segment", key, size);
  }
}

SharedSegment::~SharedSegment() {
  shmdt(data_);
  shmctl(id_, IPC_RMID, nullptr);
}

SemaphoreSet::SemaphoreSet(key_t key, int count, int mode) : id_(semget(key, count, IPC_CREAT | IPC_EXCL | mode)) {
  if (id_ == -1) {
    fail_to_make("semaphore set", key, static_cast<std::size_t>(count));
  }
  for (int i = 0; i < count; ++i) {
    semctl(id_, i, SETVAL, SemaphoreArgument{0});
  }
}

SemaphoreSet::~SemaphoreSet() { semctl(id_, 0, IPC_RMID); }

void SemaphoreSet::add(unsigned short index, short amount) const {
  sembuf operation{index, amount, SEM_UNDO};
  while (semop(id_, &operation, 1) != 0 && errno == EINTR) {
  }
}

bool SemaphoreSet::is_zero(unsigned short index) const {
  sembuf operation{index, 0, IPC_NOWAIT};
  return semop(id_, &operation, 1) == 0 || errno != EAGAIN;
}

pid_t SemaphoreSet::last_process(unsigned short index) const { return semctl(id_, index, GETPID); }

}  // namespace hbd
