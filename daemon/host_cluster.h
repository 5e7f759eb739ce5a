/* This host as a cluster of one node. */
#ifndef HBD_HOST_CLUSTER_H
#define HBD_HOST_CLUSTER_H

#include <map>
#include <vector>

#include "change.h"
#include "configuration.h"
#include "host_table.h"

namespace hbd {

/**
 * Turns tables of the host into a configuration and changes to it. Node 0 is the host, each address is an adapter
 * whose type is the name of its interface, and each kind of interface is a network, numbered as they are first seen.
 * An adapter keeps its number while its address stays.
 */
class HostCluster {
 public:
  explicit HostCluster(const HostTable& table);

  /** The configuration at the start. */
  [[nodiscard]] const Configuration& configuration() const { return configuration_; }

  /** What is different in the table since the last one, in the order in which it is to be told. */
  std::vector<Change> changes_to(const HostTable& table);

 private:
  struct Member {
    HostAddress address;
    Hb_Adapter_Number number;
    bool up;
  };

  void remove_gone(const HostTable& table, ConfigurationChange& change);
  void add_new(const HostTable& table, ConfigurationChange& change);
  std::vector<Change> take_states(const HostTable& table);
  Adapter adapter_of(const HostAddress& address, const Interface& interface, Hb_Adapter_Number number,
                     ConfigurationChange& change);
  Hb_Network_Number network_of(const Interface& interface, ConfigurationChange& change);

  Configuration configuration_;
  std::map<HostAddress, Member> members_;
  std::vector<std::string> networks_;
  std::vector<bool> used_; /* by adapter number */
};

}  // namespace hbd

#endif
