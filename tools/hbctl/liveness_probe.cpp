#include "liveness_probe.h"

#include <set>

#include "event_source.h"
#include "hb_client/events.h"
#include "subscriber.h"
#include "wait.h"

namespace hbctl {
namespace {

constexpr const char* kName = "hbctl.probe";

// The subscriptions whose group has not come yet.
std::set<std::string> names_of(const std::vector<Subscription>& subscriptions) {
  std::set<std::string> names;
  for (const Subscription& subscription : subscriptions) names.insert(subscription.name);
  return names;
}

void follow_until(const Deadline& deadline, std::set<std::string> awaited, Liveness& liveness) {
  EventSource source;
  while (!awaited.empty() && wait_for({source.descriptors()}, deadline) == Wake::Event) {
    const std::optional<Event> event = source.take();
    if (!event) continue;
    liveness.apply(*event);
    if (event->bits == HB_EVENT_NEW_GROUP) awaited.erase(event->subscription);
  }
}

}  // namespace

Liveness probe_liveness(const Cluster& cluster, std::chrono::milliseconds limit) {
  Liveness liveness;
  if (limit.count() == 0) return liveness;
  const auto plan = plan_subscriptions({}, HB_EVENT_DEATH | HB_EVENT_JOIN | HB_EVENT_NEW_GROUP, kName, cluster);
  liveness.follow(plan.subscriptions);
  Subscriber subscriber;
  subscriber.apply(plan.subscriptions);
  follow_until(std::chrono::steady_clock::now() + limit, names_of(plan.subscriptions), liveness);
  return liveness;
}

}  // namespace hbctl
