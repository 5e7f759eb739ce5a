#include "event_text.h"

#include <fmt/format.h>

#include "hb_client/events.h"
#include "words.h"

namespace hbctl {
namespace {

// Lines stay readable when a whole network dies: the rest is counted.
constexpr size_t kAdaptersTold = 4;

template <class Number>
std::vector<int64_t> widened(const std::vector<Number>& numbers) {
  return {numbers.begin(), numbers.end()};
}

std::string join(const std::vector<std::string>& parts) {
  std::string text;
  for (const std::string& part : parts)
    if (!part.empty()) text += (text.empty() ? "" : "; ") + part;
  return text;
}

std::string describe_member(const Member& member, const WatchState& state) {
  std::string text = fmt::format("{}", member.number);
  const Adapter* adapter = state.adapter(member.number);
  if (adapter != nullptr) {
    const Network* network = state.cluster().network(adapter->network);
    text += fmt::format(" (node {}, {}, {})", adapter->node ? fmt::format("{}", *adapter->node) : "-",
                        network != nullptr ? network->name : "-", adapter->address);
  }
  return member.removed ? text + " removed from the configuration" : text;
}

std::string describe_members(const Event& event, const WatchState& state) {
  if (event.bits == HB_EVENT_NEW_GROUP || event.adapters.empty())
    return number_ranges(widened(event.adapter_numbers()));
  std::string text;
  for (size_t i = 0; i < event.adapters.size() && i < kAdaptersTold; ++i)
    text += (i == 0 ? "" : ", ") + describe_member(event.adapters[i], state);
  if (event.adapters.size() > kAdaptersTold) text += fmt::format(" and {} more", event.adapters.size() - kAdaptersTold);
  return text;
}

std::string describe_identity(const GroupIdentity& identity) {
  const std::string leader = identity.leader == HB_NO_ADAPTER ? "no leader" : fmt::format("leader {}", identity.leader);
  return fmt::format("{}, incarnation {}, ", leader, identity.incarnation);
}

std::string describe_group(const Event& event) {
  const std::string text = event.identity ? describe_identity(*event.identity) : "";
  return event.stable ? text + (*event.stable ? "stable" : "unstable") : text;
}

std::string describe_tally(const Tally& tally) {
  if (tally.all() == 0 || tally.unknown != 0) return "";
  return fmt::format("{} of {} up", tally.up, tally.all());
}

template <class Number>
std::string change_text(const char* what, const std::vector<Number>& numbers) {
  return numbers.empty() ? "" : fmt::format("{} {}", what, number_ranges(widened(numbers)));
}

std::string describe_configuration(const WatchState& state) {
  const Cluster& cluster = state.cluster();
  const ConfigurationChange& change = state.last_change();
  return join({fmt::format("{}, {}, {}", count_of(static_cast<int64_t>(cluster.nodes.size()), "node"),
                           count_of(static_cast<int64_t>(cluster.adapters.size()), "adapter"),
                           count_of(static_cast<int64_t>(cluster.networks.size()), "network")),
               change_text("nodes added", change.nodes_added), change_text("nodes removed", change.nodes_removed),
               change_text("adapters added", change.adapters_added),
               change_text("adapters removed", change.adapters_removed),
               change_text("addresses changed of adapters", change.addresses_changed)});
}

std::string describe(const Event& event, const WatchState& state) {
  if (event.bits == HB_EVENT_CONFIGURATION) return describe_configuration(state);
  if (event.heartbeat) return describe(*event.heartbeat);
  const std::string members = event.subject == Subject::Nodes      ? number_ranges(widened(event.nodes))
                              : event.subject == Subject::Adapters ? describe_members(event, state)
                                                                   : "";
  const std::string sender =
      event.sender ? fmt::format("{} runs instance {}", event.sender->address, event.sender->instance) : "";
  return join({members, describe_group(event), sender, event.failure_data ? "failure data " + *event.failure_data : "",
               describe_tally(state.tally(event))});
}

std::string subject_word(Subject subject) {
  switch (subject) {
    case Subject::Nodes:
      return "node";
    case Subject::Adapters:
      return "adapter";
    case Subject::None:
      break;
  }
  return "-";
}

Paint paint_of(Hb_Events bits) {
  switch (bits) {
    case HB_EVENT_DEATH:
      return Paint::Bad;
    case HB_EVENT_JOIN:
      return Paint::Good;
    case HB_EVENT_NEW_GROUP:
      return Paint::Plain;
    default:
      return Paint::Notice;
  }
}

std::string columns(const std::string& time, const std::string& sequence, const std::string& subject,
                    const std::string& event) {
  return fmt::format("{:<12}  {:>8}  {:<7}  {}  ", time, sequence, subject, event);
}

// Padded before it is painted: escapes take no place on the screen.
std::string padded_event(const std::string& word) { return fmt::format("{:<18}", word); }

}  // namespace

std::string describe(const HeartbeatSettings& settings) {
  return fmt::format("client heartbeats: one every {} s at least, {}, daemon process {}", settings.threshold,
                     settings.watched ? "watched" : "not watched", settings.daemon_pid);
}

std::string event_heading(const Style& style) {
  return style.apply(Paint::Heading, columns("TIME", "SEQUENCE", "SUBJECT", padded_event("EVENT")) + "DETAILS") + '\n';
}

std::string event_line(const Event& event, const WatchState& state, const Style& style) {
  const std::string word = style.apply(paint_of(event.bits), padded_event(event_word(event.bits)));
  return columns(time_of_day(event.time), fmt::format("{}", event.sequence), subject_word(event.subject), word) +
         describe(event, state) + '\n';
}

}  // namespace hbctl
