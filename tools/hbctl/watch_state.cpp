#include "watch_state.h"

#include <algorithm>
#include <iterator>

namespace hbctl {
namespace {

// The numbers of `from` that are missing in `without`.
template <class Number>
std::vector<Number> difference(std::vector<Number> from, std::vector<Number> without) {
  std::sort(from.begin(), from.end());
  std::sort(without.begin(), without.end());
  std::vector<Number> result;
  std::set_difference(from.begin(), from.end(), without.begin(), without.end(), std::back_inserter(result));
  return result;
}

std::vector<Hb_Adapter_Number> with_another_address(const Cluster& before, const Cluster& after) {
  const AdapterIndex index(before);
  std::vector<Hb_Adapter_Number> result;
  for (const Adapter& adapter : after.adapters) {
    const Adapter* old = index.find(adapter.number);
    if (old != nullptr && old->address != adapter.address) result.push_back(adapter.number);
  }
  return result;
}

}  // namespace

ConfigurationChange compare(const Cluster& before, const Cluster& after) {
  return {difference(after.node_numbers(), before.node_numbers()),
          difference(before.node_numbers(), after.node_numbers()),
          difference(after.adapter_numbers(), before.adapter_numbers()),
          difference(before.adapter_numbers(), after.adapter_numbers()), with_another_address(before, after)};
}

void WatchState::replace_cluster(Cluster cluster) {
  last_change_ = compare(cluster_, cluster);
  cluster_ = std::move(cluster);
  index_ = AdapterIndex(cluster_);
}

Tally WatchState::tally(const Event& event) const {
  if (event.subject == Subject::Nodes) return liveness_.nodes().tally();
  if (event.subject == Subject::Adapters) return liveness_.adapters().tally();
  return {};
}

}  // namespace hbctl
