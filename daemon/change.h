/* What can happen to a cluster: the input of the membership model. */
#ifndef HBD_CHANGE_H
#define HBD_CHANGE_H

#include <optional>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include "configuration.h"

namespace hbd {

/** Adapters stop working. */
struct AdapterDeath {
  std::vector<Hb_Adapter_Number> adapters;
};

/** Adapters work again. */
struct AdapterJoin {
  std::vector<Hb_Adapter_Number> adapters;
};

/** A node stops with all its adapters. */
struct NodeDeath {
  Hb_Node_Number node = 0;
  std::string ffdc_id;
};

/** A node is back, with those of its adapters that work. */
struct NodeJoin {
  Hb_Node_Number node = 0;
  std::string ffdc_id;
};

/** A network carries nothing any more. */
struct NetworkLoss {
  Hb_Network_Number network = 0;
};

/** A network carries again. */
struct NetworkReturn {
  Hb_Network_Number network = 0;
};

/** The configuration changes: adapters go, then networks and adapters come. */
struct ConfigurationChange {
  std::vector<Hb_Adapter_Number> remove;
  std::vector<Network> add_networks;
  std::vector<Adapter> add;
};

/** A failure-data identifier becomes known. */
struct FailureData {
  std::string id;
};

/** A sender that runs another configuration instance was heard. */
struct DifferentInstance {
  Hb_IP_address6 address{};
  Hb_Config_Instance instance = 0;
};

/** The settings of the client's heartbeat. */
struct HeartbeatSettings {
  std::int32_t seconds = 0;
  std::int32_t microseconds = 0;
  bool enabled = false;
  std::int32_t daemon_pid = 0;
};

/** Adapters stop working, and nobody has noticed yet. */
struct AdapterSilence {
  std::vector<Hb_Adapter_Number> adapters;
};

/** Somebody has reported adapters down, and is believed. */
struct ReportedDeath {
  std::vector<Hb_Adapter_Number> adapters;
};

/** The time in which suspected adapters could give a sign of life is over. */
struct SuspicionEnd {
  std::vector<Hb_Adapter_Number> adapters;
};

/** An adapter is watched, or not any more. */
struct MonitoringSwitch {
  Hb_Adapter_Number adapter = 0;
  bool on = true;
};

/** An adapter's interface is switched on or off. */
struct InterfaceSwitch {
  Hb_Adapter_Number adapter = 0;
  bool on = true;
};

/** A time begins or ends in which an adapter's silence is no death. */
struct GraceSwitch {
  Hb_Adapter_Number adapter = 0;
  bool on = true;
};

/** The monitors of an interface of the local node change no state by themselves, or do so again. */
struct ManualControl {
  std::string interface;
  bool on = true;
};

/** An adapter gets another address, or loses the one that it has. */
struct NewAddress {
  Hb_Adapter_Number adapter = 0;
  std::optional<Hb_IP_address6> address;
};

/** The configuration changes: adapters have other addresses. */
struct AddressChange {
  std::vector<NewAddress> addresses;
};

using Change =
    std::variant<AdapterDeath, AdapterJoin, NodeDeath, NodeJoin, NetworkLoss, NetworkReturn, ConfigurationChange,
                 FailureData, DifferentInstance, HeartbeatSettings, AdapterSilence, ReportedDeath, SuspicionEnd,
                 MonitoringSwitch, InterfaceSwitch, GraceSwitch, ManualControl, AddressChange>;

/** Takes changes from a membership source. */
class ChangeSink {
 public:
  ChangeSink() = default;
  ChangeSink(const ChangeSink&) = delete;
  ChangeSink& operator=(const ChangeSink&) = delete;
  virtual ~ChangeSink() = default;
  virtual void apply(const Change& change) = 0;
};

/** Keeps changes until they are passed on. */
class PendingChanges : public ChangeSink {
 public:
  void apply(const Change& change) override { changes_.push_back(change); }

  /** Passes them on in their order. */
  void pass_on(ChangeSink& sink) {
    for (const Change& change : std::exchange(changes_, {})) {
      sink.apply(change);
    }
  }

 private:
  std::vector<Change> changes_;
};

}  // namespace hbd

#endif
