#include "liveness.h"

#include <algorithm>

#include "hb_client/events.h"

namespace hbctl {

template <class Number>
void StateMap<Number>::follow(const std::vector<Number>& numbers) {
  std::map<Number, State> followed;
  for (Number number : numbers) followed.emplace(number, state(number));
  states_ = std::move(followed);
}

template <class Number>
void StateMap<Number>::set(const std::vector<Number>& numbers, State state) {
  for (Number number : numbers) {
    const auto found = states_.find(number);
    if (found != states_.end()) found->second = state;
  }
}

template <class Number>
State StateMap<Number>::state(Number number) const {
  const auto found = states_.find(number);
  return found == states_.end() ? State::Unknown : found->second;
}

template <class Number>
Tally StateMap<Number>::tally() const {
  Tally tally;
  for (const auto& [number, state] : states_) {
    int& counter = state == State::Up ? tally.up : state == State::Down ? tally.down : tally.unknown;
    ++counter;
  }
  return tally;
}

template class StateMap<Hb_Node_Number>;
template class StateMap<Hb_Adapter_Number>;

void Liveness::follow(const std::vector<Subscription>& subscriptions) {
  subscriptions_ = subscriptions;
  std::vector<Hb_Node_Number> nodes;
  std::vector<Hb_Adapter_Number> adapters;
  for (const Subscription& subscription : subscriptions) {
    nodes.insert(nodes.end(), subscription.nodes.begin(), subscription.nodes.end());
    adapters.insert(adapters.end(), subscription.adapters.begin(), subscription.adapters.end());
  }
  nodes_.follow(nodes);
  adapters_.follow(adapters);
}

void Liveness::apply(const Event& event) {
  if (event.bits == HB_EVENT_NEW_GROUP) {
    for (const Subscription& subscription : subscriptions_) {
      if (subscription.name != event.subscription) continue;
      if (event.subject == Subject::Nodes) nodes_.set(subscription.nodes, State::Down);
      if (event.subject == Subject::Adapters) adapters_.set(subscription.adapters, State::Down);
    }
  }
  const State state = event.bits == HB_EVENT_DEATH ? State::Down : State::Up;
  nodes_.set(event.nodes, state);
  adapters_.set(event.adapter_numbers(), state);
}

}  // namespace hbctl
