#include "host_cluster.h"

#include <linux/if_arp.h>
#include <spdlog/spdlog.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <string_view>
#include <utility>

#include "address.h"

namespace hbd {
namespace {

constexpr std::array<std::pair<std::uint16_t, std::string_view>, 7> kinds = {{
    {ARPHRD_LOOPBACK, "loopback"},
    {ARPHRD_ETHER, "ethernet"},
    {ARPHRD_INFINIBAND, "infiniband"},
    {ARPHRD_PPP, "ppp"},
    {ARPHRD_TUNNEL, "tunnel"},
    {ARPHRD_TUNNEL6, "tunnel"},
    {ARPHRD_NONE, "tunnel"},
}};

std::string_view kind_of(const Interface& interface) {
  const auto* found =
      std::find_if(kinds.begin(), kinds.end(), [&](const auto& kind) { return kind.first == interface.hardware; });
  return found == kinds.end() ? "other" : found->second;
}

Hb_IP_address6 address_of(const HostAddress& address) {
  Hb_IP_address6 copy{};
  std::memcpy(&copy, address.bytes.data(), address.bytes.size());
  return copy;
}

bool is_running(const HostTable& table, const HostAddress& address) {
  const auto interface = table.interfaces().find(address.interface);
  return interface != table.interfaces().end() && interface->second.running;
}

}  // namespace

HostCluster::HostCluster(const HostTable& table) : used_(HB_MAX_NETWORKS) {
  configuration_.name = "host";
  configuration_.adapters_per_node = HB_MAX_NETWORKS;
  ConfigurationChange all;
  add_new(table, all);
  configuration_.networks = all.add_networks;
  for (const Adapter& adapter : all.add) {
    configuration_.adapters.emplace(adapter.number, adapter);
  }
}

std::vector<Change> HostCluster::changes_to(const HostTable& table) {
  std::vector<Change> changes;
  ConfigurationChange configuration;
  remove_gone(table, configuration);
  const auto states = take_states(table);
  add_new(table, configuration);
  if (!configuration.remove.empty() || !configuration.add.empty()) {
    changes.emplace_back(std::move(configuration));
  }
  changes.insert(changes.end(), states.begin(), states.end());
  return changes;
}

void HostCluster::remove_gone(const HostTable& table, ConfigurationChange& change) {
  for (auto each = members_.begin(); each != members_.end();) {
    if (table.addresses().contains(each->first)) {
      ++each;
      continue;
    }
    change.remove.push_back(each->second.number);
    used_[each->second.number] = false;
    each = members_.erase(each);
  }
}

void HostCluster::add_new(const HostTable& table, ConfigurationChange& change) {
  for (const HostAddress& address : table.addresses()) {
    const auto interface = table.interfaces().find(address.interface);
    if (members_.contains(address) || interface == table.interfaces().end()) {
      continue;
    }
    const auto slot = std::find(used_.begin(), used_.end(), false);
    if (slot == used_.end()) {
      spdlog::warn("{} of {} is left out: {} addresses are the most that are followed",
                   address_text(address_of(address)), interface->second.name, used_.size());
      continue;
    }
    *slot = true;
    const auto number = static_cast<Hb_Adapter_Number>(slot - used_.begin());
    change.add.push_back(adapter_of(address, interface->second, number, change));
    members_.emplace(address, Member{address, number, interface->second.running});
  }
}

Adapter HostCluster::adapter_of(const HostAddress& address, const Interface& interface, Hb_Adapter_Number number,
                                ConfigurationChange& change) {
  return {number, address_of(address), network_of(interface, change), interface.name, interface.running};
}

Hb_Network_Number HostCluster::network_of(const Interface& interface, ConfigurationChange& change) {
  const std::string kind(kind_of(interface));
  const auto known = std::find(networks_.begin(), networks_.end(), kind);
  if (known != networks_.end()) {
    return static_cast<Hb_Network_Number>(known - networks_.begin());
  }
  networks_.push_back(kind);
  change.add_networks.push_back({kind, kind});
  return static_cast<Hb_Network_Number>(networks_.size() - 1);
}

std::vector<Change> HostCluster::take_states(const HostTable& table) {
  AdapterDeath death;
  AdapterJoin join;
  for (auto& [address, member] : members_) {
    const bool up = is_running(table, address);
    if (up != member.up) {
      (up ? join.adapters : death.adapters).push_back(member.number);
      member.up = up;
    }
  }
  std::vector<Change> changes;
  if (!death.adapters.empty()) {
    changes.emplace_back(std::move(death));
  }
  if (!join.adapters.empty()) {
    changes.emplace_back(std::move(join));
  }
  return changes;
}

}  // namespace hbd
