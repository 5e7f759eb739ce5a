#include "event_json.h"

#include "hb_client/events.h"
#include "words.h"

namespace hbctl {
namespace {

Json member_json(const Member& member, const WatchState& state) {
  Json json = {{"number", member.number}};
  const Adapter* adapter = state.adapter(member.number);
  const Network* network = adapter != nullptr ? state.cluster().network(adapter->network) : nullptr;
  json["node"] = adapter != nullptr ? or_null(adapter->node) : Json(nullptr);
  json["network"] = network != nullptr ? Json(network->name) : Json(nullptr);
  json["address"] = adapter != nullptr ? Json(adapter->address) : Json(nullptr);
  json["incarnation"] = member.incarnation;
  json["removed"] = member.removed;
  return json;
}

void add_members(Json& json, const Event& event, const WatchState& state) {
  if (event.subject == Subject::Nodes) json["nodes"] = event.nodes;
  if (event.subject == Subject::Adapters) {
    json["adapters"] = Json::array();
    for (const Member& member : event.adapters) json["adapters"].push_back(member_json(member, state));
  }
}

void add_tally(Json& json, const Event& event, const WatchState& state) {
  const Tally tally = state.tally(event);
  if (tally.all() != 0) json["watched"] = {{"up", tally.up}, {"down", tally.down}, {"unknown", tally.unknown}};
}

void add_group(Json& json, const Event& event) {
  if (event.stable) json["stable"] = *event.stable;
  if (event.identity) {
    json["leader"] = event.identity->leader;
    json["group_incarnation"] = event.identity->incarnation;
  }
}

void add_configuration(Json& json, const WatchState& state) {
  const Cluster& cluster = state.cluster();
  const ConfigurationChange& change = state.last_change();
  json["configured"] = {{"nodes", cluster.nodes.size()},
                        {"adapters", cluster.adapters.size()},
                        {"networks", cluster.networks.size()},
                        {"sites", cluster.sites.size()}};
  json["added"] = {{"nodes", change.nodes_added}, {"adapters", change.adapters_added}};
  json["removed"] = {{"nodes", change.nodes_removed}, {"adapters", change.adapters_removed}};
  json["addresses_changed"] = change.addresses_changed;
}

}  // namespace

Json heartbeat_json(const HeartbeatSettings& settings) {
  return {{"threshold", settings.threshold}, {"watched", settings.watched}, {"daemon_pid", settings.daemon_pid}};
}

Json event_json(const Event& event, const WatchState& state) {
  Json json = json_object("event");
  json["time"] = utc_timestamp(event.time);
  json["sequence"] = event.sequence;
  json["event"] = event_word(event.bits);
  json["bits"] = event.bits;
  json["subscription"] = event.subscription;
  add_members(json, event, state);
  add_group(json, event);
  if (event.failure_data) json["failure_data"] = *event.failure_data;
  if (event.sender) json["sender"] = {{"address", event.sender->address}, {"instance", event.sender->instance}};
  if (event.bits == HB_EVENT_CONFIGURATION) add_configuration(json, state);
  if (event.heartbeat) json["heartbeat"] = heartbeat_json(*event.heartbeat);
  add_tally(json, event, state);
  return json;
}

}  // namespace hbctl
