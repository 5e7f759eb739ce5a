// The words for values of the interface, the same in tables, in JSON and on the command line.
#pragma once

#include <string>
#include <vector>

#include "hb_client/control.h"
#include "hb_client/group.h"
#include "liveness.h"

namespace hbctl {

std::string state_word(State state);
std::string reason_word(Hb_Entity_State_Reason reason);

// What the daemon's monitoring says of an adapter: "up", "not-monitored", ...
std::string monitoring_word(Hb_Adapter_state_t state);

// "death", "new-group", ...; "event" for bits that have no word.
std::string event_word(Hb_Events bits);

// The words that --events takes, without "all".
std::vector<std::string> subscribable_words();

// The bits of one word of --events; "all" is every one. The word is one of those.
Hb_Events bits_of_word(const std::string& word);

}  // namespace hbctl
