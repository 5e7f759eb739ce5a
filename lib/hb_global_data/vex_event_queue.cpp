#include "hb_global_data/vex_event_queue.h"

#include "hb_global_data/mutex_section.h"
#include "hb_global_data/start_up.h"

Hb_VEX_Event* event_queue_list = nullptr;
zu_int32_t event_sequence = 0;

Hb_Boolean VEX_event_queue_is_empty() {
  pthread_once(&hbapi_global_data_once, hbapi_global_data_once_init);
  Hb_Boolean empty = Hb_True;
  HB_MUTEX_SECTION_BEGIN(event_queue_list_and_sequence_mutex)
  empty = event_queue_list == nullptr ? Hb_True : Hb_False;
  HB_MUTEX_SECTION_END(event_queue_list_and_sequence_mutex)
  return empty;
}
