/* The membership model: who is up, and what each change means for it. */
#ifndef HBD_CLUSTER_H
#define HBD_CLUSTER_H

#include <set>
#include <vector>

#include "change.h"
#include "configuration.h"
#include "event.h"
#include "member_set.h"

namespace hbd {

/**
 * Configuration and membership of one cluster.
 *
 * An adapter is up while it works, its node runs and its network carries. A node is up while one of its adapters is.
 * All adapters that are up form one adapter group, all nodes that are up one node group; the lowest number leads.
 */
class Cluster {
 public:
  explicit Cluster(Configuration configuration);

  /** Makes a change and says what clients have to be told, in that order; nothing when it makes no difference. */
  std::vector<Event> apply(const Change& change);

  [[nodiscard]] const Configuration& configuration() const { return configuration_; }
  [[nodiscard]] const MemberSet& up_adapters() const { return up_adapters_; }
  [[nodiscard]] const MemberSet& up_nodes() const { return up_nodes_; }
  [[nodiscard]] bool network_is_available(Hb_Network_Number network) const;
  [[nodiscard]] bool node_is_running(Hb_Node_Number node) const { return runs_[static_cast<std::size_t>(node)]; }
  /** How often the adapter has joined. */
  [[nodiscard]] Hb_Incarnation incarnation(Hb_Adapter_Number adapter) const { return incarnations_[adapter]; }
  [[nodiscard]] Hb_Incarnation adapter_group_incarnation() const { return adapter_group_; }
  [[nodiscard]] Hb_Incarnation node_group_incarnation() const { return node_group_; }
  /** Number of the last event; 1 before the first one. */
  [[nodiscard]] Hb_Seq_Num sequence() const { return sequence_; }
  /** Number of the configuration, from 1. */
  [[nodiscard]] Hb_Sequence_Number configuration_sequence() const { return configuration_sequence_; }

 private:
  struct Delta;

  void change(const AdapterDeath& death, Delta& delta);
  void change(const AdapterJoin& join, Delta& delta);
  void change(const NodeDeath& death, Delta& delta);
  void change(const NodeJoin& join, Delta& delta);
  void change(const NetworkLoss& loss, Delta& delta);
  void change(const NetworkReturn& back, Delta& delta);
  void change(const ConfigurationChange& update, Delta& delta);
  void change(const FailureData& data, Delta& delta);
  void change(const DifferentInstance& sender, Delta& delta);
  void change(const HeartbeatSettings& settings, Delta& delta);

  void set_working(const std::vector<Hb_Adapter_Number>& adapters, bool working, Delta& delta);
  void set_running(Hb_Node_Number node, bool running, Delta& delta);
  void set_available(Hb_Network_Number network, bool available, Delta& delta);
  void remove_adapter(Hb_Adapter_Number number, Delta& delta);
  void add_adapter(const Adapter& adapter, Delta& delta);

  [[nodiscard]] bool should_be_up(const Adapter& adapter) const;
  [[nodiscard]] bool has_adapters(Hb_Node_Number node) const;
  void settle(const Adapter& adapter, Delta& delta);
  void raise(Hb_Adapter_Number number, Delta& delta);
  void lower(Hb_Adapter_Number number, Hb_Incarnation flag, Delta& delta);
  void settle_nodes(Delta& delta);
  std::vector<Event> events_of(Delta& delta);

  Configuration configuration_;
  MemberSet up_adapters_;
  MemberSet up_nodes_;
  std::vector<int> up_count_; /* by node: its adapters that are up */
  std::vector<Hb_Incarnation> incarnations_;
  std::vector<bool> runs_;      /* by node */
  std::vector<bool> available_; /* by network */
  Hb_Incarnation adapter_group_ = 1;
  Hb_Incarnation node_group_ = 1;
  Hb_Seq_Num sequence_ = 1;
  Hb_Sequence_Number configuration_sequence_ = 1;
};

}  // namespace hbd

#endif
