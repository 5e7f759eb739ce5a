/* What can happen to a cluster: the input of the membership model. */
#ifndef HBD_CHANGE_H
#define HBD_CHANGE_H

#include <string>
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

using Change = std::variant<AdapterDeath, AdapterJoin, NodeDeath, NodeJoin, NetworkLoss, NetworkReturn,
                            ConfigurationChange, FailureData, DifferentInstance, HeartbeatSettings>;

/** Takes changes from a membership source. */
class ChangeSink {
 public:
  ChangeSink() = default;
  ChangeSink(const ChangeSink&) = delete;
  ChangeSink& operator=(const ChangeSink&) = delete;
  virtual ~ChangeSink() = default;
  virtual void apply(const Change& change) = 0;
};

}  // namespace hbd

#endif
