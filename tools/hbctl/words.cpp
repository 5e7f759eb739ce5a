#include "words.h"

#include <fmt/format.h>

#include <algorithm>
#include <iterator>

#include "hb_client/events.h"

namespace hbctl {
namespace {

struct EventWord {
  const char* word;
  Hb_Events bits;
  bool subscribable;
};

constexpr EventWord kEventWords[] = {
    {"empty", HB_EVENT_NONE, false},
    {"death", HB_EVENT_DEATH, true},
    {"join", HB_EVENT_JOIN, true},
    {"new-group", HB_EVENT_NEW_GROUP, true},
    {"failure-data", HB_EVENT_FFDC_ID, false},
    {"sites", HB_EVENT_SITES, true},
    {"site-split", HB_EVENT_SITE_SPLIT, false},
    {"site-merge", HB_EVENT_SITE_MERGE, false},
    {"configuration", HB_EVENT_CONFIGURATION, false},
    {"different-instance", HB_EVENT_DIFF_INSTANCE, true},
    {"heartbeat", HB_EVENT_NODE_HEARTBEAT, true},
    {"split-merge", HB_EVENT_SPLIT_MERGE, true},
    {"subcluster-split", HB_EVENT_SUBCLUSTER_SPLIT, false},
    {"subcluster-merge", HB_EVENT_SUBCLUSTER_MERGE, false},
    {"alias", HB_EVENT_ALIAS, false},
};

constexpr const char* kReasonWords[] = {
    "down",      "up",        "brixd-down",  "brixd-up", "local-split", "remote-split",
    "link-down", "shut-down", "forced-down", "stopped",  "undefined",
};

// From 1.
constexpr const char* kMonitoringWords[] = {
    "unknown",
    "up",
    "down",
    "interface-down",
    "misconfigured",
    "broadcast-misconfigured",
    "not-monitored",
    "no-monitor",
    "monitor-error",
    "cannot-bind-socket",
    "cannot-open-device",
};

}  // namespace

std::string state_word(State state) {
  switch (state) {
    case State::Up:
      return "up";
    case State::Down:
      return "down";
    case State::Unknown:
      break;
  }
  return "unknown";
}

std::string reason_word(Hb_Entity_State_Reason reason) {
  if (reason < 0 || reason >= static_cast<int>(std::size(kReasonWords))) return fmt::format("reason {}", int{reason});
  return kReasonWords[reason];
}

std::string monitoring_word(Hb_Adapter_state_t state) {
  const int number = state;
  if (number < 1 || number > static_cast<int>(std::size(kMonitoringWords))) return fmt::format("state {}", number);
  return kMonitoringWords[number - 1];
}

std::string event_word(Hb_Events bits) {
  for (const EventWord& entry : kEventWords)
    if (entry.bits == bits) return entry.word;
  return "event";
}

std::vector<std::string> subscribable_words() {
  std::vector<std::string> words;
  for (const EventWord& entry : kEventWords)
    if (entry.subscribable) words.emplace_back(entry.word);
  return words;
}

Hb_Events bits_of_word(const std::string& word) {
  Hb_Events bits = 0;
  for (const EventWord& entry : kEventWords)
    if (entry.subscribable && (word == "all" || word == entry.word)) bits |= entry.bits;
  return bits;
}

}  // namespace hbctl
