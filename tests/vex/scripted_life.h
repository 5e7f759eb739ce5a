// A cluster that lives: each operation changes the scripted cluster as the change would, and notifies the monitors that
// would tell of it. What a program should think of the cluster follows from the script alone.
#pragma once

#include <set>
#include <string>

#include "caller.h"
#include "scripted_cluster.h"

namespace hb_test {

class Scripted_Life {
 public:
  static constexpr uint32_t local_node = 1;

  // Nodes 1 to `node_count`, all up, with the interfaces en0 and en1 and a boot address on each.
  explicit Scripted_Life(uint32_t node_count);

  // Nodes. Their interfaces come and go with them; a stale interface keeps the state that was known of it.
  void node_dies(uint32_t node, zu_vex_node_down_reason_t reason,
                 zu_vex_intf_status_t interfaces = ZU_VEX_INTF_STATUS_DOWN);
  void node_returns(uint32_t node);
  void report_node(uint32_t node, zu_evm_event_type_t type);  // without a change

  // A node that the configuration gets, up, or loses; only the monitor of the node list tells of it.
  void configure_node(uint32_t node);
  void remove_node(uint32_t node);

  // Interfaces.
  void interface_dies(uint32_t node, const std::string& name);
  void interface_returns(uint32_t node, const std::string& name);
  void report_interface(uint32_t node, const std::string& name, zu_evm_event_type_t type);  // without a change

  // Addresses. An alias stands in front of the interface's other addresses, so that their places change.
  void add_alias(uint32_t node, const std::string& name, const zu_vex_IP_address6_t& address);
  void remove_alias(uint32_t node, const std::string& name, const zu_vex_IP_address6_t& address);
  void add_boot_address(uint32_t node, unsigned interface);
  void remove_boot_address(uint32_t node, unsigned interface);
  void move_boot_address(uint32_t from, unsigned interface, uint32_t to);  // to the interface of that name
  void change_address(uint32_t node, unsigned interface, const zu_vex_IP_address6_t& address);
  void report_address(uint32_t node, const std::string& name, const zu_vex_IP_address6_t& address,
                      zu_evm_event_type_t type);  // without a change

  // The nodes of the other part go, and come back one by one.
  void split_off(const std::set<uint32_t>& other_part);
  void merge(const std::set<uint32_t>& other_part);
  void heal(const std::set<uint32_t>& other_part);  // back at once, and unreported

  // One notification each of the monitors that tell nothing of members.
  void report_site();
  void report_process();
  void report_reconfiguration();

  // Readable without a notification.
  void wake_nodes();
  void wake_adapters();

  // What a program should think. A node that is held down has lost its group-services daemon. Of an alias a program
  // learns when it comes and goes; it may or may not be among the adapters, so pictures are compared without them.
  std::set<int> configured_nodes() const;
  std::set<int> nodes_up() const;
  std::set<Known_Adapter> configured_adapters() const;
  std::set<Known_Adapter> adapters_up() const;
  std::set<Known_Adapter> without_aliases(std::set<Known_Adapter> adapters) const;
  std::set<uint32_t> held_down;

  bool is_up(uint32_t node) const;
  bool is_up(uint32_t node, const std::string& name) const;
  size_t notifications() const { return notifications_; }

  static zu_vex_IP_address6_t boot_address(uint32_t node, unsigned interface);

 private:
  static Scripted_Node& node(uint32_t number);
  static Scripted_Interface& interface(uint32_t node, const std::string& name);  // the first of that name
  // Those of one name, or all of them.
  static void set_interfaces(uint32_t node, zu_vex_intf_status_t status, const std::string& name = "");
  static void add_interfaces(uint32_t node, std::vector<Scripted_Interface>& list);
  static void insert(const Scripted_Interface& interface);
  static void erase(uint32_t node, const zu_vex_IP_address6_t& address);
  template <typename Condition>
  std::set<Known_Adapter> adapters_that(Condition condition) const;
  void notify_split_merge(zu_evm_event_type_t type, const std::set<uint32_t>& other_part);

  std::set<std::string> aliases_;
  size_t notifications_ = 0;
  uint64_t sequence_ = 0x100000000;
};

}  // namespace hb_test
