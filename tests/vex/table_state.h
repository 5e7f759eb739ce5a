// What the tests of configuration tables and interface lists share.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "handler_state.h"
#include "support/allocation_faults.h"
#include "support/process_state.h"
#include "zu_evm.h"

namespace hb_test {

inline constexpr int untouched_number = 12345;  // an error number that nothing sets

// The records with that id, as "Errors 36: [a call()] [(Default)] -1 7": so many texts come first, then numbers.
inline std::vector<std::string> data_lines(uint32_t id, size_t texts) {
  static constexpr const char* names[] = {"Errors", "Info", "Debug"};
  std::vector<std::string> lines;
  for (const Recorded_Trace& record : platform_double().traces_of(id)) {
    std::string line = record.category < 0 ? "?" : names[record.category];
    line += ' ' + std::to_string(id) + ':';
    for (size_t block = 0; block < record.blocks.size(); ++block) {
      line += block < texts ? " [" + record.block_text(block) + ']'
                            : ' ' + std::to_string(static_cast<int32_t>(record.block_value(block)));
    }
    lines.push_back(line);
  }
  return lines;
}

// The records of the form without data with that id.
inline std::vector<std::string> value_lines(uint32_t id) {
  std::vector<std::string> lines;
  for (const Recorded_Trace& record : platform_double().traces_of(id)) lines.push_back(line_of(record));
  return lines;
}

inline Scripted_Interface interface_of(uint32_t node, const std::string& name, uint8_t index,
                                       zu_vex_intf_status_t status = ZU_VEX_INTF_STATUS_UP) {
  return {
      .node = node, .name = name, .address = scripted_address(1, static_cast<uint8_t>(node), index), .status = status};
}

// A list that belongs to the test, as a caller has one.
inline zu_vex_net_intf_info_t* callers_list(const std::vector<Scripted_Interface>& interfaces) {
  std::vector<std::string> names;
  for (const Scripted_Interface& interface : interfaces) names.push_back(interface.name.value_or(""));
  std::vector<zu_vex_net_intf_info_t> records;
  for (size_t i = 0; i < interfaces.size(); ++i) {
    zu_vex_net_intf_info_t& record = records.emplace_back();
    record.node_number = interfaces[i].node;
    record.p_name = interfaces[i].name ? names[i].data() : nullptr;
    record.ip_addr = interfaces[i].address;
    record.status = interfaces[i].status;
    record.flags = interfaces[i].flags;
  }
  return platform_double().interface_list(records);
}

inline bool has_address(const Hb_Adapter& adapter, const zu_vex_IP_address6_t& address) {
  return std::memcmp(&adapter.Hb_ip_address, &address, sizeof address) == 0;
}

inline Hb_Adapter* by_address(const Hb_Configuration_Internal& table, const zu_vex_IP_address6_t& address) {
  H_IPv6_key_t key;
  std::memcpy(&key, &address, sizeof key);
  return static_cast<Hb_Adapter*>(Hash_search_IPv6(&key, table.ip_hash));
}

inline Hb_Adapter* by_number(const Hb_Configuration_Internal& table, uint32_t number) {
  return static_cast<Hb_Adapter*>(Hash_search(number, table.adap_hash));
}

inline Hb_Node_config_state* by_node(const Hb_Configuration_Internal& table, uint32_t node) {
  return static_cast<Hb_Node_config_state*>(Hash_search(node, table.node_hash));
}

// A cluster of nobody, with services. What is handed out has to come back.
class TableState : public HandlerState {
 protected:
  TableState() {
    scripted_cluster().appear();
    set_hb_errno(untouched_number);
    start_tracing();
  }
  ~TableState() override {
    empty_global_config_table(&table);
    EXPECT_EQ(Scripted_Cluster::wrong_releases(), 0U);
    EXPECT_EQ(Scripted_Cluster::outstanding(), expected_outstanding);
  }

  // Errors and all of the others are on, or nothing.
  static void trace_nothing() { platform_double().set_levels({0, 0, 0}); }

  Hb_Configuration_Internal table = {};
  size_t expected_outstanding = 0;  // records that are not given back
};

}  // namespace hb_test
