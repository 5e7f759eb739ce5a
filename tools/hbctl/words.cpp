#include "words.h"

#include <fmt/format.h>

#include <algorithm>
#include <iterator>

#include "hb_client/events.h"

namespace hbctl {
namespace {

struct EventWord {
  Hb_Events bits;
  const char* word;
  bool subscribable;
};

constexpr EventWord kEventWords[] = {
    {HB_EVENT_NONE, "empty", false},
    {HB_EVENT_DEATH, "death", true},
    {HB_EVENT_JOIN, "join", true},
    {HB_EVENT_NEW_GROUP, "new-group", true},
    {HB_EVENT_FFDC_ID, "failure-data", false},
    {HB_EVENT_SITES, "sites", true},
    {HB_EVENT_SITE_SPLIT, "site-split", false},
    {HB_EVENT_SITE_MERGE, "site-merge", false},
    {HB_EVENT_CONFIGURATION, "configuration", false},
    {HB_EVENT_DIFF_INSTANCE, "different-instance", true},
    {HB_EVENT_NODE_HEARTBEAT, "heartbeat", true},
    {HB_EVENT_SPLIT_MERGE, "split-merge", true},
    {HB_EVENT_SUBCLUSTER_SPLIT, "subcluster-split", false},
    {HB_EVENT_SUBCLUSTER_MERGE, "subcluster-merge", false},
    {HB_EVENT_ALIAS, "alias", false},
};

constexpr const char* kReasonWords[] = {
    "down",      "up",        "brixd-down",  "brixd-up", "local-split", "remote-split",
    "link-down", "shut-down", "forced-down", "stopped",  "undefined",
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
