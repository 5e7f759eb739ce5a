#include "deadlines.h"

#include <algorithm>

namespace hbd {

Deadlines::Deadlines(Loop& loop, ChangeSink& sink)
    : loop_(loop), sink_(sink), timer_(loop, [this] { make_what_is_due(); }) {}

void Deadlines::set(DeadlineKey key, std::chrono::milliseconds delay, Change change) {
  cancel(key);
  const auto due = loop_.now() + delay;
  entries_.emplace(key, Entry{due, std::move(change)});
  order_.emplace(due, key);
  schedule();
}

void Deadlines::cancel(DeadlineKey key) {
  const auto found = entries_.find(key);
  if (found != entries_.end()) {
    order_.erase({found->second.due, key});
    entries_.erase(found);
  }
}

void Deadlines::make_what_is_due() {
  while (!order_.empty() && order_.begin()->first <= loop_.now()) {
    const DeadlineKey key = order_.begin()->second;
    const Change change = std::move(entries_.at(key).change);
    cancel(key);
    sink_.apply(change);
  }
  schedule();
}

void Deadlines::schedule() {
  if (order_.empty()) {
    timer_.stop();
  } else {
    timer_.start(std::max(std::chrono::milliseconds(0), order_.begin()->first - loop_.now()));
  }
}

}  // namespace hbd
