// A section under one of the two global mutexes. A thread that is cancelled inside it leaves the mutex unlocked; a lock
// or unlock that fails is an assertion whose text names the mutex. The two macros stand in one block, as the thread
// library's own pair that they contain.
#pragma once

#include <pthread.h>

#include "hb_global_data/start_up.h"
#include "zu_cu.h"

// The call is done, and its text reported when it does not yield 0.
#define HB_GLOBAL_DATA_ASSERT_ZERO(call) assert_zero((call), #call " == 0", __LINE__)

inline void assert_zero(int result, const char* text, int line) {
  if (result != 0) {
    __zu_assert(text, "lib/hb_global_data", line);
  }
}

#define HB_MUTEX_SECTION_BEGIN(mutex)                          \
  pthread_cleanup_push(hbapi_mutex_cleanup_handler, &(mutex)); \
  assert_zero(pthread_mutex_lock(&(mutex)), "pthread_mutex_lock(&" #mutex ") == 0", __LINE__);

#define HB_MUTEX_SECTION_END(mutex)                                                                \
  assert_zero(pthread_mutex_unlock(&(mutex)), "pthread_mutex_unlock(&" #mutex ") == 0", __LINE__); \
  pthread_cleanup_pop(0);
