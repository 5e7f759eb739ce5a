#include "hb_communication/reader_hold.h"

#include <sys/ipc.h>
#include <sys/sem.h>

#include <cerrno>
#include <cstddef>

#include "hb_global_data/state.h"

namespace {

// A signal that interrupts the wait changes nothing about what is waited for.
template <size_t N>
bool operate(sembuf (&operations)[N]) {
  int result = semop(shm_sem_id, operations, N);
  while (result == -1 && errno == EINTR) {
    result = semop(shm_sem_id, operations, N);
  }
  return result == 0;
}

}  // namespace

Reader_Hold::Reader_Hold() {
  pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &cancel_state_);
  sembuf enter[] = {{HB_READERS_SEMAPHORE, 1, SEM_UNDO}, {HB_WRITER_SEMAPHORE, 0, 0}};
  held_ = operate(enter);
}

Reader_Hold::~Reader_Hold() {
  if (held_) {
    sembuf leave[] = {{HB_READERS_SEMAPHORE, -1, SEM_UNDO}};
    operate(leave);
  }
  pthread_setcancelstate(cancel_state_, nullptr);
}
