// The reader's side of the lock over the shared segments, held for as long as the object lives. A process that dies
// with it leaves nothing behind, as the kernel undoes it. The thread is not cancelled meanwhile.
#pragma once

#include <pthread.h>

class Reader_Hold {
 public:
  // Waits while the daemon writes. Without a semaphore set (the daemon has gone and taken it along) nothing is held.
  Reader_Hold();
  ~Reader_Hold();
  Reader_Hold(const Reader_Hold&) = delete;
  Reader_Hold& operator=(const Reader_Hold&) = delete;

 private:
  int cancel_state_ = PTHREAD_CANCEL_ENABLE;
  bool held_ = false;
};
