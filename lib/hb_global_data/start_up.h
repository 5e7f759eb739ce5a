// Starting and stopping: the once-only creation of the mutexes, and what hb_init and hb_terminate share with others.
#pragma once

#include "hb_client/lifecycle.h"
#include "hb_global_data/state.h"

void hbapi_global_data_once_init();

// Creates the two mutexes unless they are there. Whatever takes one of them begins with this.
inline void make_mutex_once() { pthread_once(&hbapi_global_data_once, hbapi_global_data_once_init); }

// Unlocks the mutex it is given; runs when a thread is cancelled while it holds one of the two.
void hbapi_mutex_cleanup_handler(void* p_argument);
