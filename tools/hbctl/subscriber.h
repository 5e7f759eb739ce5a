// The subscriptions that are in force at the daemon, for as long as the object lives.
#pragma once

#include <vector>

#include "subscription_plan.h"

namespace hbctl {

class Subscriber {
 public:
  Subscriber() = default;
  // Withdraws everything; what fails then no longer matters.
  ~Subscriber();
  Subscriber(const Subscriber&) = delete;
  Subscriber& operator=(const Subscriber&) = delete;

  // Registers what is new or different, withdraws what is no longer wanted. Throws CommandError.
  void apply(const std::vector<Subscription>& wanted);

 private:
  std::vector<Subscription> in_force_;
};

}  // namespace hbctl
