/* Requests about an adapter of the local node. */
#ifndef HBD_ADAPTER_CONTROL_H
#define HBD_ADAPTER_CONTROL_H

#include "cluster.h"
#include "deadlines.h"
#include "interface_control.h"

namespace hbd {

/** Which adapter is meant, by its network, and the value that comes with some requests. */
struct AdapterTarget {
  Hb_Network_Number network = 0;
  std::uint32_t value = 0; /**< an IPv4 address in network byte order, or seconds */
};

/** Serves them. Each yields the status of the answer, also those that are not answered. */
class AdapterControl {
 public:
  AdapterControl(const Cluster& cluster, ChangeSink& sink, InterfaceControl& interfaces, Deadlines& deadlines)
      : cluster_(cluster), sink_(sink), interfaces_(interfaces), deadlines_(deadlines) {}

  Hb_Request_Status enable(const AdapterTarget& target);
  Hb_Request_Status disable(const AdapterTarget& target);
  Hb_Request_Status interface_down(const AdapterTarget& target);
  Hb_Request_Status interface_up(const AdapterTarget& target);
  Hb_Request_Status configure(const AdapterTarget& target);
  Hb_Request_Status unconfigure(const AdapterTarget& target);
  Hb_Request_Status swap(const AdapterTarget& target);
  Hb_Request_Status grace(const AdapterTarget& target);
  /** Whether there is a state to tell of, which is then found in `state`. */
  Hb_Request_Status state(const AdapterTarget& target, Hb_Adapter_state_t& state) const;

 private:
  [[nodiscard]] const Adapter* find(Hb_Network_Number network) const;
  [[nodiscard]] const Adapter* find(const Hb_IP_address6& address) const;
  [[nodiscard]] Hb_Request_Status check(const AdapterTarget& target) const;
  [[nodiscard]] Hb_Request_Status check_change(const AdapterTarget& target) const;
  [[nodiscard]] bool is_acceptable(const Hb_IP_address6& address) const;
  [[nodiscard]] bool local_node_is_dead() const;
  Hb_Request_Status switch_monitoring(const AdapterTarget& target, bool on);
  Hb_Request_Status switch_interface(const AdapterTarget& target, bool on);

  const Cluster& cluster_;
  ChangeSink& sink_;
  InterfaceControl& interfaces_;
  Deadlines& deadlines_;
};

}  // namespace hbd

#endif
