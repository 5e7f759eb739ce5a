// What a watch knows of the cluster besides the event at hand.
#pragma once

#include "cluster.h"
#include "liveness.h"

namespace hbctl {

struct ConfigurationChange {
  std::vector<Hb_Node_Number> nodes_added;
  std::vector<Hb_Node_Number> nodes_removed;
  std::vector<Hb_Adapter_Number> adapters_added;
  std::vector<Hb_Adapter_Number> adapters_removed;
  std::vector<Hb_Adapter_Number> addresses_changed;  // adapters with another address than before
};

ConfigurationChange compare(const Cluster& before, const Cluster& after);

class WatchState {
 public:
  explicit WatchState(Cluster cluster) : cluster_(std::move(cluster)), index_(cluster_) {}
  WatchState(const WatchState&) = delete;
  WatchState& operator=(const WatchState&) = delete;

  const Cluster& cluster() const { return cluster_; }
  const Adapter* adapter(Hb_Adapter_Number number) const { return index_.find(number); }
  const ConfigurationChange& last_change() const { return last_change_; }
  Liveness& liveness() { return liveness_; }
  const Liveness& liveness() const { return liveness_; }

  void replace_cluster(Cluster cluster);

  // The states of what an event is about; all zero when it is about neither nodes nor adapters.
  Tally tally(const Event& event) const;

 private:
  Cluster cluster_;
  AdapterIndex index_;
  ConfigurationChange last_change_;
  Liveness liveness_;
};

}  // namespace hbctl
