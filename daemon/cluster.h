/* The membership model: who is up, and what each change means for it. */
#ifndef HBD_CLUSTER_H
#define HBD_CLUSTER_H

#include <map>
#include <set>
#include <string>
#include <vector>

#include "change.h"
#include "configuration.h"
#include "event.h"
#include "hb_client/control.h"
#include "member_set.h"

namespace hbd {

/**
 * Configuration and membership of one cluster.
 *
 * An adapter is up while it works, has an address, its interface is on, nobody has reported it down since it last
 * joined with or without its node, was switched on or watched anew, its node runs and its network carries. A node
 * is up while it runs and one of its adapters is up. All adapters that are up form one adapter group, all nodes that
 * are up one node group; the lowest number leads.
 *
 * What is told of an adapter stays as it is while the adapter is not monitored; while its monitor is under manual
 * control only requests change it; and in a time of grace it does not die.
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
  [[nodiscard]] bool is_monitored(Hb_Adapter_Number adapter) const { return steering_of(adapter).monitored; }
  /** Whether the adapter is configured and has not lost its address. */
  [[nodiscard]] bool has_address(Hb_Adapter_Number adapter) const { return steering_of(adapter).has_address; }
  [[nodiscard]] bool is_under_manual_control(const std::string& interface) const { return manual_.contains(interface); }
  /** What monitoring says of an adapter. */
  [[nodiscard]] Hb_Adapter_state_t state(Hb_Adapter_Number adapter) const;
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
  void change(const AdapterSilence& silence, Delta& delta);
  void change(const ReportedDeath& report, Delta& delta);
  void change(const SuspicionEnd& end, Delta& delta);
  void change(const MonitoringSwitch& wanted, Delta& delta);
  void change(const InterfaceSwitch& wanted, Delta& delta);
  void change(const GraceSwitch& grace, Delta& delta);
  void change(const ManualControl& control, Delta& delta);
  void change(const AddressChange& update, Delta& delta);

  /* Who makes an adapter's state change: its monitor, or somebody who has a right to whatever the monitor says. */
  enum class Cause { Monitor, Request };

  /* How requests have left an adapter. */
  struct Steering {
    bool monitored = true;
    bool interface_on = true;
    bool has_grace = false;
    bool has_address = true;
    bool reported_down = false;   /* until something is done about it */
    bool request_is_held = false; /* a request would have changed the state, but for the time of grace */
  };

  void set_working(const std::vector<Hb_Adapter_Number>& adapters, bool working, Cause cause, Delta& delta);
  template <typename Visit>
  void for_each_configured(const std::vector<Hb_Adapter_Number>& adapters, Visit visit);
  void forget_report(Hb_Adapter_Number number);
  void set_running(Hb_Node_Number node, bool running, Delta& delta);
  void set_available(Hb_Network_Number network, bool available, Delta& delta);
  void remove_adapter(Hb_Adapter_Number number, Delta& delta);
  void add_adapter(const Adapter& adapter, Delta& delta);

  [[nodiscard]] bool should_be_up(const Adapter& adapter) const;
  [[nodiscard]] bool has_adapters(Hb_Node_Number node) const;
  [[nodiscard]] Steering steering_of(Hb_Adapter_Number adapter) const;
  [[nodiscard]] bool is_manual(const Adapter& adapter) const;
  [[nodiscard]] bool is_held(const Adapter& adapter, bool wanted, Cause cause) const;
  void settle(const Adapter& adapter, Cause cause, Delta& delta);
  void tell_again(const Adapter& adapter, Delta& delta);
  void join(Hb_Adapter_Number number, Delta& delta);
  void raise(Hb_Adapter_Number number, Delta& delta);
  void lower(Hb_Adapter_Number number, Hb_Incarnation flag, Delta& delta);
  void settle_nodes(Delta& delta);
  std::vector<Event> events_of(Delta& delta);

  Configuration configuration_;
  MemberSet up_adapters_;
  MemberSet up_nodes_;
  std::vector<int> up_count_; /* by node: its adapters that are up */
  std::vector<Hb_Incarnation> incarnations_;
  std::vector<bool> runs_;                         /* by node */
  std::vector<bool> available_;                    /* by network */
  std::map<Hb_Adapter_Number, Steering> steering_; /* of those that a request has touched */
  std::set<std::string> manual_;                   /* interfaces of the local node */
  Hb_Incarnation adapter_group_ = 1;
  Hb_Incarnation node_group_ = 1;
  Hb_Seq_Num sequence_ = 1;
  Hb_Sequence_Number configuration_sequence_ = 1;
};

}  // namespace hbd

#endif
