/* Random changes that a seed decides: the same seed, the same changes. */
#ifndef HBD_CHURN_H
#define HBD_CHURN_H

#include <optional>
#include <random>
#include <string_view>
#include <vector>

#include "cluster.h"
#include "scenario.h"

namespace hbd {

/** Name of a kind of change in scenarios, for events and for churn. */
std::string_view name_of(ChurnKind kind);

/** A source of random changes. It never takes the local node down, and looks at no clock. */
class Churn {
 public:
  explicit Churn(const ChurnSettings& settings);

  /** When the next change is due; nothing at the end. */
  [[nodiscard]] std::optional<std::chrono::microseconds> next_time() const;
  /** The change that is due; nothing when none of the kinds has a subject at present. */
  std::optional<Change> take(const Cluster& cluster);

 private:
  std::optional<Change> make(ChurnKind kind, const Cluster& cluster);
  static std::vector<Hb_Adapter_Number> victims(const Cluster& cluster);
  std::optional<Change> adapter_death(const Cluster& cluster);
  std::optional<Change> adapter_silence(const Cluster& cluster);
  std::optional<Change> adapter_join(const Cluster& cluster);
  std::optional<Change> node_death(const Cluster& cluster);
  std::optional<Change> node_join(const Cluster& cluster);
  std::optional<Change> network_loss(const Cluster& cluster);
  std::optional<Change> network_return(const Cluster& cluster);
  std::optional<Change> configuration_update(const Cluster& cluster);
  Change failure_data();
  std::optional<Change> different_instance(const Cluster& cluster);
  Change heartbeat();

  std::uint64_t below(std::uint64_t limit) { return generator_() % limit; }
  template <typename Item>
  const Item* pick(const std::vector<Item>& items) {
    return items.empty() ? nullptr : &items[below(items.size())];
  }
  void draw_time();

  ChurnSettings settings_;
  std::mt19937_64 generator_;
  std::chrono::microseconds next_{};
  std::uint64_t made_ = 0;
  std::vector<Adapter> removed_; /* adapters that are to come back some time */
};

}  // namespace hbd

#endif
