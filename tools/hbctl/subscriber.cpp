#include "subscriber.h"

#include <algorithm>
#include <memory>

#include "errors.h"
#include "hb_client.h"

namespace hbctl {
namespace {

void require(Hb_Rc result, const Subscription& subscription) {
  if (result != Hb_Success) throw library_error("cannot subscribe as " + subscription.name);
}

void fill(Hb_Subscription_Group& group, const Subscription& wanted) {
  require(hb_empty_subscription_group(&group), wanted);
  switch (wanted.kind) {
    case Members::EveryNode:
      return require(hb_add_all_nodes_to_subscription_group(&group), wanted);
    case Members::EveryAdapter:
      return require(hb_add_all_adapters_to_subscription_group(&group), wanted);
    case Members::Network:
      return require(hb_add_network_to_subscription_group(&group, wanted.network), wanted);
    case Members::Nodes:
      for (auto node : wanted.nodes) require(hb_add_node_to_subscription_group(&group, node), wanted);
      return;
    case Members::Adapters:
      for (auto adapter : wanted.adapters) require(hb_add_adapter_to_subscription_group(&group, adapter), wanted);
      return;
    case Members::None:
      return;
  }
}

void subscribe(Subscription wanted) {
  const auto group = std::make_unique<Hb_Subscription_Group>();
  fill(*group, wanted);
  require(hb_subscribe(wanted.name.data(), group.get(), wanted.events), wanted);
}

void unsubscribe(std::string name) { hb_unsubscribe(name.data()); }

bool contains_name(const std::vector<Subscription>& subscriptions, const std::string& name) {
  return std::any_of(subscriptions.begin(), subscriptions.end(),
                     [&](const Subscription& item) { return item.name == name; });
}

}  // namespace

void Subscriber::apply(const std::vector<Subscription>& wanted) {
  for (const Subscription& old : in_force_)
    if (!contains_name(wanted, old.name)) unsubscribe(old.name);
  for (const Subscription& subscription : wanted)
    if (std::find(in_force_.begin(), in_force_.end(), subscription) == in_force_.end()) subscribe(subscription);
  in_force_ = wanted;
}

Subscriber::~Subscriber() {
  for (const Subscription& subscription : in_force_) unsubscribe(subscription.name);
}

}  // namespace hbctl
