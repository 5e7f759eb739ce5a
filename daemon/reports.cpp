#include "reports.h"

#include <spdlog/spdlog.h>

namespace hbd {
namespace {

using Purpose = DeadlineKey::Purpose;

std::chrono::milliseconds milliseconds_of(const timeval& time) {
  return std::chrono::seconds(time.tv_sec) + std::chrono::milliseconds(time.tv_usec / 1000);
}

}  // namespace

std::vector<Hb_Adapter_Number> Reports::adapters_of(std::int32_t node) const {
  const Configuration& configuration = cluster_.configuration();
  std::vector<Hb_Adapter_Number> numbers;
  if (node < 0 || node >= configuration.max_nodes) {
    return numbers;
  }
  const auto end = configuration.adapters.lower_bound(configuration.adapter_number(node + 1, 0));
  for (auto each = configuration.adapters.lower_bound(configuration.adapter_number(node, 0)); each != end; ++each) {
    numbers.push_back(each->first);
  }
  return numbers;
}

bool Reports::is_configured(std::int32_t adapter) const {
  return adapter >= 0 && cluster_.configuration().adapters.contains(static_cast<Hb_Adapter_Number>(adapter));
}

bool Reports::node_may_be_down(std::int32_t number) {
  auto adapters = adapters_of(number);
  if (adapters.empty()) {
    return false;
  }
  deadlines_.set({Purpose::NodeSuspicion, static_cast<std::uint32_t>(number)}, suspicion_,
                 SuspicionEnd{std::move(adapters)});
  return true;
}

bool Reports::node_is_down(std::int32_t number) {
  if (adapters_of(number).empty()) {
    return false;
  }
  deadlines_.cancel({Purpose::NodeSuspicion, static_cast<std::uint32_t>(number)});
  sink_.apply(NodeDeath{static_cast<Hb_Node_Number>(number), {}});
  return true;
}

bool Reports::adapter_may_be_down(std::int32_t number) {
  if (!is_configured(number)) {
    return false;
  }
  const auto adapter = static_cast<Hb_Adapter_Number>(number);
  deadlines_.set({Purpose::AdapterSuspicion, adapter}, suspicion_, SuspicionEnd{{adapter}});
  return true;
}

bool Reports::adapter_is_down(std::int32_t number) {
  if (!is_configured(number)) {
    return false;
  }
  const auto adapter = static_cast<Hb_Adapter_Number>(number);
  deadlines_.cancel({Purpose::AdapterSuspicion, adapter});
  sink_.apply(ReportedDeath{{adapter}});
  return true;
}

void Reports::simulate_death(std::int32_t seconds) {
  const Hb_Node_Number node = cluster_.configuration().local_node;
  const auto period = seconds > 0 ? std::chrono::milliseconds(std::chrono::seconds(seconds))
                                  : milliseconds_of(cluster_.configuration().local_node_down_period);
  spdlog::info("this node, number {}, plays dead for {} ms", node, period.count());
  sink_.apply(NodeDeath{node, {}});
  deadlines_.set({Purpose::NodeReturn, static_cast<std::uint32_t>(node)}, period, NodeJoin{node, {}});
}

}  // namespace hbd
