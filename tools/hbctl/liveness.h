// Who is up, as far as the events so far tell.
#pragma once

#include <map>
#include <vector>

#include "event.h"
#include "subscription_plan.h"

namespace hbctl {

enum class State { Unknown, Up, Down };

struct Tally {
  int up = 0;
  int down = 0;
  int unknown = 0;
  int all() const { return up + down + unknown; }
};

template <class Number>
class StateMap {
 public:
  // Keeps the states of these, forgets all others; new ones are unknown.
  void follow(const std::vector<Number>& numbers);
  // Sets those that are followed.
  void set(const std::vector<Number>& numbers, State state);
  State state(Number number) const;
  Tally tally() const;

 private:
  std::map<Number, State> states_;
};

class Liveness {
 public:
  // Takes the members of these subscriptions as what is followed.
  void follow(const std::vector<Subscription>& subscriptions);

  // A death or join changes those it names. A new group also tells who is not in it: every other member of the
  // subscription that it belongs to is down.
  void apply(const Event& event);

  const StateMap<Hb_Node_Number>& nodes() const { return nodes_; }
  const StateMap<Hb_Adapter_Number>& adapters() const { return adapters_; }

 private:
  std::vector<Subscription> subscriptions_;
  StateMap<Hb_Node_Number> nodes_;
  StateMap<Hb_Adapter_Number> adapters_;
};

}  // namespace hbctl
