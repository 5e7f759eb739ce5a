// What the monitors have in common whose notifications are traced, and of which a caller learns no event.
#pragma once

#include <cerrno>

#include "hb_client/events.h"
#include "vex_platform_records.h"

// Of a list so many records are looked at: one without an end is no reason to stay for ever.
enum { notifications_looked_at = HB_MAX_NODES };

// So many characters of a name are recorded.
enum { longest_name = 255 };

inline Hb_Rc monitor_cannot_be_read(Trace_Record record, int read_result, int descriptor) {
  const int error = errno;
  trace_data(Trace_Info, record, {block_of(read_result), block_of(descriptor), block_of(error)});
  return Hb_Failure;
}

// Nothing that the caller has to know of; the other outputs stay as they are.
inline Hb_Rc without_event(Hb_Events* events) {
  *events = HB_EVENT_NONE;
  return Hb_Success;
}

// Calls use(record) for each record of a list.
template <typename Record, typename Use>
void for_each_notification(const Record* list, Use use) {
  int count = 0;
  for (const Record* record = list; record != nullptr && count < notifications_looked_at; record = record->next) {
    use(*record);
    ++count;
  }
}
