// A section under one of the two global mutexes. A thread that is cancelled inside it leaves the mutex unlocked; a lock
// or unlock that fails is an assertion whose text names the mutex. The two macros stand in one block, as the thread
// library's own pair that they contain.
#pragma once

#include <pthread.h>

#include "hb_global_data/start_up.h"
#include "zu_cu.h"

#define HB_GLOBAL_DATA_ASSERT(condition)                       \
  do {                                                         \
    if (!(condition)) {                                        \
      __zu_assert(#condition, "lib/hb_global_data", __LINE__); \
    }                                                          \
  } while (false)

#define HB_MUTEX_SECTION_BEGIN(mutex)                          \
  pthread_cleanup_push(hbapi_mutex_cleanup_handler, &(mutex)); \
  HB_GLOBAL_DATA_ASSERT(pthread_mutex_lock(&mutex) == 0);

#define HB_MUTEX_SECTION_END(mutex)                         \
  HB_GLOBAL_DATA_ASSERT(pthread_mutex_unlock(&mutex) == 0); \
  pthread_cleanup_pop(0);
