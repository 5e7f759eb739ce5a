#include "scripted_life.h"

#include <algorithm>
#include <stdexcept>

#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_EVMONIPChangeEventHandler.h"
#include "VEX_EVMONNodeListHandler.h"
#include "VEX_EVMONNodeLivenessHandler.h"
#include "VEX_EVMONPeerGSLivenessHandler.h"
#include "VEX_EVMONReconfigEventHandler.h"
#include "VEX_EVMONSiteConfigEventHandler.h"
#include "hb_global_data/state.h"

namespace hb_test {

namespace {

constexpr unsigned interfaces_per_node = 2;

std::string name_of(unsigned interface) { return "en" + std::to_string(interface); }

std::string text_of(const zu_vex_IP_address6_t& address) { return hexadecimal(&address, sizeof address); }

Known_Adapter known(const Scripted_Interface& interface) {
  return {static_cast<int>(interface.node), interface.name.value_or(""), text_of(interface.address)};
}

char* text(std::string& text) { return text.data(); }

}  // namespace

zu_vex_IP_address6_t Scripted_Life::boot_address(uint32_t node, unsigned interface) {
  return scripted_address(static_cast<uint8_t>(interface), 0, static_cast<uint8_t>(node));
}

Scripted_Life::Scripted_Life(uint32_t node_count) {
  Scripted_Cluster& cluster = scripted_cluster();
  cluster.appear();
  cluster.local_node = local_node;
  for (uint32_t number = 1; number <= node_count; ++number) {
    cluster.nodes.push_back({.number = number});
    add_interfaces(number, cluster.interfaces);
    add_interfaces(number, cluster.boot_addresses);
  }
}

void Scripted_Life::add_interfaces(uint32_t node, std::vector<Scripted_Interface>& list) {
  for (unsigned interface = 0; interface < interfaces_per_node; ++interface) {
    list.push_back({.node = node, .name = name_of(interface), .address = boot_address(node, interface)});
  }
}

Scripted_Node& Scripted_Life::node(uint32_t number) {
  for (Scripted_Node& node : scripted_cluster().nodes) {
    if (node.number == number) {
      return node;
    }
  }
  throw std::logic_error("the script has no such node");
}

Scripted_Interface& Scripted_Life::interface(uint32_t node, const std::string& name) {
  for (Scripted_Interface& interface : scripted_cluster().interfaces) {
    if (interface.node == node && interface.name == name) {
      return interface;
    }
  }
  throw std::logic_error("the script has no such interface");
}

void Scripted_Life::set_interfaces(uint32_t node, zu_vex_intf_status_t status, const std::string& name) {
  for (Scripted_Interface& interface : scripted_cluster().interfaces) {
    if (interface.node == node && (name.empty() || interface.name == name)) {
      interface.status = status;
    }
  }
}

bool Scripted_Life::is_up(uint32_t number) const { return node(number).status == ZU_VEX_NODE_STATUS_UP; }

bool Scripted_Life::is_up(uint32_t node, const std::string& name) const {
  return interface(node, name).status == ZU_VEX_INTF_STATUS_UP;
}

void Scripted_Life::node_dies(uint32_t number, zu_vex_node_down_reason_t reason, zu_vex_intf_status_t interfaces) {
  node(number).status = ZU_VEX_NODE_STATUS_DOWN;
  node(number).reason = reason;
  set_interfaces(number, interfaces);
  report_node(number, ZU_EVM_EVENT_DOWN);
}

void Scripted_Life::node_returns(uint32_t number) {
  node(number).status = ZU_VEX_NODE_STATUS_UP;
  node(number).reason = ZU_VEX_NODE_DOWN_REASON_NONE;
  set_interfaces(number, ZU_VEX_INTF_STATUS_UP);
  report_node(number, ZU_EVM_EVENT_UP);
}

void Scripted_Life::report_node(uint32_t number, zu_evm_event_type_t type) {
  zu_evm_event_node_liveness_t record = {};
  record.event_type = type;
  record.node_number = number;
  record.sequence_number = ++sequence_;
  scripted_cluster().notify(node_liveness_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

void Scripted_Life::configure_node(uint32_t number) {
  scripted_cluster().nodes.push_back({.number = number});
  add_interfaces(number, scripted_cluster().interfaces);
  add_interfaces(number, scripted_cluster().boot_addresses);
  zu_evm_event_node_list_t record = {};
  record.event_type = ZU_EVM_EVENT_ADD;
  record.node_number = number;
  scripted_cluster().notify(node_list_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

void Scripted_Life::remove_node(uint32_t number) {
  Scripted_Cluster& cluster = scripted_cluster();
  const auto is_of_node = [number](const Scripted_Interface& interface) { return interface.node == number; };
  std::erase_if(cluster.nodes, [number](const Scripted_Node& node) { return node.number == number; });
  std::erase_if(cluster.interfaces, is_of_node);
  std::erase_if(cluster.boot_addresses, is_of_node);
  zu_evm_event_node_list_t record = {};
  record.event_type = ZU_EVM_EVENT_DELETE;
  record.node_number = number;
  cluster.notify(node_list_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

void Scripted_Life::interface_dies(uint32_t node, const std::string& name) {
  set_interfaces(node, ZU_VEX_INTF_STATUS_DOWN, name);
  report_interface(node, name, ZU_EVM_EVENT_DOWN);
}

void Scripted_Life::interface_returns(uint32_t node, const std::string& name) {
  set_interfaces(node, ZU_VEX_INTF_STATUS_UP, name);
  report_interface(node, name, ZU_EVM_EVENT_UP);
}

void Scripted_Life::report_interface(uint32_t node, const std::string& name, zu_evm_event_type_t type) {
  std::string interface_name = name;
  zu_evm_event_adapter_liveness_t record = {};
  record.event_type = type;
  record.node_number = node;
  record.sequence_number = ++sequence_;
  record.p_interface_name = text(interface_name);
  scripted_cluster().notify(adapter_event_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

// In front of the node's others.
void Scripted_Life::insert(const Scripted_Interface& interface) {
  std::vector<Scripted_Interface>& interfaces = scripted_cluster().interfaces;
  const auto place = std::find_if(interfaces.begin(), interfaces.end(),
                                  [&](const Scripted_Interface& other) { return other.node >= interface.node; });
  interfaces.insert(place, interface);
}

void Scripted_Life::erase(uint32_t node, const zu_vex_IP_address6_t& address) {
  std::erase_if(scripted_cluster().interfaces, [&](const Scripted_Interface& interface) {
    return interface.node == node && text_of(interface.address) == text_of(address);
  });
}

void Scripted_Life::add_alias(uint32_t node, const std::string& name, const zu_vex_IP_address6_t& address) {
  aliases_.insert(text_of(address));
  insert({.node = node, .name = name, .address = address});
  report_address(node, name, address, ZU_EVM_ADDRESS_ADD);
}

void Scripted_Life::remove_alias(uint32_t node, const std::string& name, const zu_vex_IP_address6_t& address) {
  erase(node, address);
  report_address(node, name, address, ZU_EVM_ADDRESS_DELETE);
}

void Scripted_Life::add_boot_address(uint32_t node, unsigned interface) {
  insert({.node = node, .name = name_of(interface), .address = boot_address(node, interface)});
  report_address(node, name_of(interface), boot_address(node, interface), ZU_EVM_ADDRESS_ADD);
}

void Scripted_Life::remove_boot_address(uint32_t node, unsigned interface) {
  erase(node, boot_address(node, interface));
  report_address(node, name_of(interface), boot_address(node, interface), ZU_EVM_ADDRESS_DELETE);
}

void Scripted_Life::move_boot_address(uint32_t from, unsigned interface, uint32_t to) {
  const zu_vex_IP_address6_t address = boot_address(from, interface);
  erase(from, address);
  insert({.node = to, .name = name_of(interface), .address = address});
  report_address(from, name_of(interface), address, ZU_EVM_ADDRESS_DELETE);
  report_address(to, name_of(interface), address, ZU_EVM_ADDRESS_ADD);
}

void Scripted_Life::change_address(uint32_t node, unsigned interface, const zu_vex_IP_address6_t& address) {
  for (Scripted_Interface& present : scripted_cluster().interfaces) {
    if (present.node == node && present.name == name_of(interface) && !aliases_.contains(text_of(present.address))) {
      present.address = address;
    }
  }
  report_address(node, name_of(interface), address, ZU_EVM_ADDRESS_CHG);
}

void Scripted_Life::report_address(uint32_t node, const std::string& name, const zu_vex_IP_address6_t& address,
                                   zu_evm_event_type_t type) {
  std::string interface_name = name;
  zu_evm_event_ip_change_t record = {};
  record.event_type = type;
  record.node_number = node;
  record.sequence_number = ++sequence_;
  record.p_interface_name = text(interface_name);
  record.ip_addr = address;
  scripted_cluster().notify(ip_change_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

void Scripted_Life::split_off(const std::set<uint32_t>& other_part) {
  for (const uint32_t number : other_part) {
    node(number).status = ZU_VEX_NODE_STATUS_DOWN;
    node(number).reason = ZU_VEX_NODE_DOWN_REASON_LINK_DOWN;
    set_interfaces(number, ZU_VEX_INTF_STATUS_DOWN);
  }
  notify_split_merge(ZU_EVM_SUBCLUSTER_SPLIT, other_part);
}

void Scripted_Life::merge(const std::set<uint32_t>& other_part) {
  notify_split_merge(ZU_EVM_SUBCLUSTER_MERGE, other_part);
}

void Scripted_Life::heal(const std::set<uint32_t>& other_part) {
  for (const uint32_t number : other_part) {
    node(number).status = ZU_VEX_NODE_STATUS_UP;
    node(number).reason = ZU_VEX_NODE_DOWN_REASON_NONE;
    set_interfaces(number, ZU_VEX_INTF_STATUS_UP);
  }
}

void Scripted_Life::notify_split_merge(zu_evm_event_type_t type, const std::set<uint32_t>& other_part) {
  std::vector<uint32_t> local;
  for (const Scripted_Node& node : scripted_cluster().nodes) {
    if (!other_part.contains(node.number)) {
      local.push_back(node.number);
    }
  }
  std::vector<uint32_t> remote(other_part.begin(), other_part.end());
  zu_evm_event_split_merge_cfg_t record = {};
  record.event_type = type;
  record.event_subtype = ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_LOCAL;
  record.sequence_number = ++sequence_;
  record.num_local_node_up = static_cast<uint32_t>(local.size());
  record.num_remote_node_up = static_cast<uint32_t>(remote.size());
  record.local_node_numbers = local.data();
  record.remote_node_numbers = remote.data();
  scripted_cluster().notify(node_liveness_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

void Scripted_Life::report_site() {
  std::string name = "site";
  zu_evm_event_site_cfg_t record = {};
  record.event_type = ZU_EVM_SITE_MODIFY;
  record.node_number = local_node;
  record.site_number = 1;
  record.site_name = text(name);
  scripted_cluster().notify(site_config_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

void Scripted_Life::report_process() {
  std::string name = "group-services";
  zu_evm_event_process_liveness_t record = {};
  record.event_type = ZU_EVM_EVENT_UP;
  record.process_id = 1;
  record.process_name = text(name);
  scripted_cluster().notify(peer_GS_liveness_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

void Scripted_Life::report_reconfiguration() {
  zu_evm_event_cluster_reconfig_t record = {};
  record.event_type = ZU_EVM_EVENT_ADD;
  record.node_number = local_node;
  scripted_cluster().notify(cluster_reconfig_handler_p->getFileDescriptor(), record);
  ++notifications_;
}

void Scripted_Life::wake_nodes() { scripted_cluster().wake(node_liveness_handler_p->getFileDescriptor()); }

void Scripted_Life::wake_adapters() { scripted_cluster().wake(adapter_event_handler_p->getFileDescriptor()); }

std::set<int> Scripted_Life::configured_nodes() const {
  std::set<int> numbers;
  for (const Scripted_Node& node : scripted_cluster().nodes) {
    numbers.insert(static_cast<int>(node.number));
  }
  return numbers;
}

std::set<int> Scripted_Life::nodes_up() const {
  std::set<int> numbers;
  for (const Scripted_Node& node : scripted_cluster().nodes) {
    if (node.status == ZU_VEX_NODE_STATUS_UP && !held_down.contains(node.number)) {
      numbers.insert(static_cast<int>(node.number));
    }
  }
  return numbers;
}

template <typename Condition>
std::set<Known_Adapter> Scripted_Life::adapters_that(Condition condition) const {
  std::set<Known_Adapter> adapters;
  for (const Scripted_Interface& interface : scripted_cluster().interfaces) {
    if (condition(interface)) {
      adapters.insert(known(interface));
    }
  }
  return without_aliases(adapters);
}

std::set<Known_Adapter> Scripted_Life::configured_adapters() const {
  return adapters_that([](const Scripted_Interface&) { return true; });
}

std::set<Known_Adapter> Scripted_Life::adapters_up() const {
  return adapters_that([](const Scripted_Interface& interface) { return interface.status == ZU_VEX_INTF_STATUS_UP; });
}

std::set<Known_Adapter> Scripted_Life::without_aliases(std::set<Known_Adapter> adapters) const {
  std::erase_if(adapters, [this](const Known_Adapter& adapter) { return aliases_.contains(adapter.address); });
  return adapters;
}

}  // namespace hb_test
