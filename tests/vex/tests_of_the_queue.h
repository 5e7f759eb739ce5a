// What the tests of the event queue share.
#pragma once

#include <thread>

#include "handler_state.h"
#include "support/system_calls.h"

namespace hb_test {

// Only what is done with the mutex of the queue is recorded and scripted.
class QueueMutexCalls : public SystemCalls {
 public:
  QueueMutexCalls() {
    only("pthread_mutex_lock", 0, &event_queue_list_and_sequence_mutex);
    only("pthread_mutex_unlock", 0, &event_queue_list_and_sequence_mutex);
  }
};

class EventQueue : public HandlerState {
 protected:
  // Whether another thread gets the mutex.
  static bool is_mutex_free() {
    bool is_free = false;
    std::thread other([&is_free] {
      is_free = pthread_mutex_trylock(&event_queue_list_and_sequence_mutex) == 0;
      if (is_free) {
        pthread_mutex_unlock(&event_queue_list_and_sequence_mutex);
      }
    });
    other.join();
    return is_free;
  }
};

}  // namespace hb_test
