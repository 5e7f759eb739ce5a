// What a VEX-mode handler fills for its caller.
#pragma once

#include <cstring>

#include "event_names.h"
#include "hb_client/events.h"

struct Vex_Outputs {
  Hb_Events* events;
  char* name;  // at least 32 bytes
  Hb_Group* group;
  Hb_Seq_Num* seqnum;
};

// The text is cut where the name's field ends.
inline void put_name(char* name, const char* text) {
  const size_t length = strnlen(text, HB_NAME_LENGTH - 1);
  std::memcpy(name, text, length);
  name[length] = '\0';
}

// The event is the subscription's. Without a subscription there is no event, and the result is false.
inline bool put_subscription_name(Hb_Events* events, char* name, const char* subscription) {
  if (subscription[0] != '\0') {
    put_name(name, subscription);
    return true;
  }
  *events = HB_EVENT_NONE;
  put_name(name, empty_event_name);
  return false;
}

// Nothing happened that the caller has to know of.
inline Hb_Rc deliver_no_event(const Vex_Outputs& out, Hb_Seq_Num seqnum) {
  *out.events = HB_EVENT_NONE;
  *out.seqnum = seqnum;
  put_name(out.name, empty_event_name);
  return Hb_Success;
}
