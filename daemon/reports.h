/* What clients report of adapters and nodes: that they are, or may be, down; and the death of this node that is played.
 */
#ifndef HBD_REPORTS_H
#define HBD_REPORTS_H

#include "cluster.h"
#include "deadlines.h"

namespace hbd {

/** Takes reports. Numbers that belong to nobody change nothing and yield false. */
class Reports {
 public:
  /** @param suspicion time in which one that may be down can give a sign of life. */
  Reports(const Cluster& cluster, ChangeSink& sink, Deadlines& deadlines, std::chrono::milliseconds suspicion)
      : cluster_(cluster), sink_(sink), deadlines_(deadlines), suspicion_(suspicion) {}

  bool node_may_be_down(std::int32_t number);
  bool node_is_down(std::int32_t number);
  bool adapter_may_be_down(std::int32_t number);
  bool adapter_is_down(std::int32_t number);

  /** The local node is dead for so many seconds; for as long as the configuration says when it is none. */
  void simulate_death(std::int32_t seconds);

 private:
  [[nodiscard]] std::vector<Hb_Adapter_Number> adapters_of(std::int32_t node) const;
  [[nodiscard]] bool is_configured(std::int32_t adapter) const;

  const Cluster& cluster_;
  ChangeSink& sink_;
  Deadlines& deadlines_;
  std::chrono::milliseconds suspicion_;
};

}  // namespace hbd

#endif
