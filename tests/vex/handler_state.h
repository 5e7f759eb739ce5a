// A fixture around the state that VEX-mode handlers change, and what tests of handlers share.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "VEX_EVMONHandler.h"
#include "VEX_HBC_trace.h"
#include "hb_client.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/start_up.h"
#include "hb_global_data/vex_event_queue.h"
#include "hb_global_data/vex_handler_set.h"
#include "platform_doubles.h"

namespace hb_test {

// A record without data or text, as "Errors 170: 7 9".
inline std::string line_of(const Recorded_Trace& record) {
  static constexpr const char* names[] = {"Errors", "Info", "Debug"};
  std::string line = record.category < 0 ? "?" : names[record.category];
  line += ' ' + std::to_string(record.id);
  for (size_t i = 0; i < record.values.size(); ++i) {
    line += (i == 0 ? ": " : " ") + std::to_string(static_cast<int32_t>(record.values[i]));
  }
  return line;
}

inline std::vector<std::string> trace_lines() {
  std::vector<std::string> lines;
  for (const Recorded_Trace& record : platform_double().traces) {
    lines.push_back(line_of(record));
  }
  return lines;
}

// Bytes that wait to be read.
inline int waiting_bytes(int descriptor) {
  int bytes = -1;
  return ioctl(descriptor, FIONREAD, &bytes) == 0 ? bytes : -1;
}

struct Ends {
  int32_t fds[2];
  int read() const { return fds[0]; }
  int write() const { return fds[1]; }
};

inline Ends new_pipe() {
  Ends ends = {{-1, -1}};
  if (pipe(ends.fds) != 0) {
    ADD_FAILURE() << "no pipe: " << std::strerror(errno);
  }
  return ends;
}

// The record is too large for the stack.
inline std::unique_ptr<Hb_Group> group_of_bytes(unsigned char byte) {
  auto group = std::make_unique<Hb_Group>();
  std::memset(static_cast<void*>(group.get()), byte, sizeof *group);
  return group;
}

inline bool same_bytes(const Hb_Group& first, const Hb_Group& second) {
  return std::memcmp(&first, &second, sizeof first) == 0;
}

struct Table_Node {
  Hb_Node_Number number;
  Hb_Entity_State state = Hb_Entity_Up;
  Hb_Entity_State_Reason reason = Hb_Entity_State_Reason_Up;
};

struct Table_Adapter {
  Hb_Adapter_Number number;
  Hb_Entity_State state = Hb_Entity_Up;
  std::string type = "en0";
  zu_vex_IP_address6_t address = {};
};

inline Hb_Adapter record_of(const Table_Adapter& adapter) {
  Hb_Adapter record = {};
  std::memcpy(&record.Hb_ip_address, &adapter.address, sizeof record.Hb_ip_address);
  std::strncpy(record.Hb_adapter_type, adapter.type.c_str(), sizeof record.Hb_adapter_type - 1);
  record.Hb_adapter_num = adapter.number;
  record.Hb_state = adapter.state;
  return record;
}

// Fills an empty table.
inline void fill_table(Hb_Configuration_Internal& table, int max_nodes, int adapters_per_node,
                       const std::vector<Table_Node>& nodes, const std::vector<Table_Adapter>& adapters) {
  table.Hb_max_nodes = max_nodes;
  table.Hb_adapters_per_node = adapters_per_node;
  table.node_list = new Hb_Node_config_state[HB_MAX_NODES]();
  table.node_hash = Hash_init("nodes", prime(static_cast<int>(2 * nodes.size())));
  for (const Table_Node& node : nodes) {
    Hb_Node_config_state& record = table.node_list[table.Hb_num_nodes++];
    record = {node.number, node.state, node.reason};
    Hash_insert(static_cast<uint32_t>(node.number), table.node_hash, &record);
  }
  table.Hb_global_adapter_list = new Hb_Adapter[adapters.size()];
  table.adap_hash = Hash_init("adapters", prime(static_cast<int>(2 * adapters.size())));
  table.ip_hash = Hash_init("addresses", prime(static_cast<int>(2 * adapters.size())));
  for (const Table_Adapter& adapter : adapters) {
    Hb_Adapter& record = table.Hb_global_adapter_list[table.Hb_num_adapters++];
    record = record_of(adapter);
    H_IPv6_key_t address;
    std::memcpy(&address, &record.Hb_ip_address, sizeof address);
    Hash_insert(record.Hb_adapter_num, table.adap_hash, &record);
    Hash_insert_IPv6(&address, table.ip_hash, &record);
  }
}

inline Hb_Node_config_state& node_of(Hb_Node_Number number) {
  return *static_cast<Hb_Node_config_state*>(Hash_search(static_cast<uint32_t>(number), global_config_tbl.node_hash));
}

inline void set_name(Hb_Name& name, const char* text) { std::strncpy(name, text, sizeof name); }

// Every test starts with nothing queued, registered or configured, and with all categories of trace on.
class HandlerState : public testing::Test {
 protected:
  HandlerState() {
    forget();
    set_levels(1);
    pthread_once(&hbapi_global_data_once, hbapi_global_data_once_init);
  }
  ~HandlerState() override { forget(); }

  static void set_levels(uint8_t level) {
    platform_double().reset();
    platform_double().levels = {level, level, level};
    hbc_trace_inited = 0;
    hbc_initialize_trace_once();
  }

  // An event of that kind at the end of the queue.
  static Hb_VEX_Event* queue(Hb_Group_Type type, Hb_Events events) {
    Hb_VEX_Event* event = VEX_new_event(type);
    event->group.Hb_events = events;
    VEX_add_event_at_end(event);
    return event;
  }

  static std::unique_ptr<Hb_VEX_Event> take() { return std::unique_ptr<Hb_VEX_Event>(VEX_get_event_from_head()); }

  // What is traced from here on.
  static void start_tracing() { platform_double().traces.clear(); }

 private:
  static void forget() {
    IsVEX = Hb_False;
    client_initialized = Hb_False;
    VEX_delete_global_event_handlers();
    while (take() != nullptr) {
    }
    event_sequence = 0;
    empty_global_config_table(&global_config_tbl);
    empty_global_config_table(&global_config_tbl_new);
    std::memset(nodeEventSubscriptionName, 0, sizeof nodeEventSubscriptionName);
    std::memset(networkEventSubscriptionName, 0, sizeof networkEventSubscriptionName);
    std::memset(siteEventSubscriptionName, 0, sizeof siteEventSubscriptionName);
    std::memset(splitMergeEventSubscriptionName, 0, sizeof splitMergeEventSubscriptionName);
    set_hb_errno(0);
    platform_double().reset();
  }
};

// The outputs of a handler, all filled with what no handler writes.
struct Handler_Outputs {
  Hb_Events events = 0x5A5A5A5A;
  char name[64];
  std::unique_ptr<Hb_Group> group = group_of_bytes(0x5A);
  Hb_Seq_Num seqnum = 0x5A5A5A5A;

  Handler_Outputs() { std::memset(name, 0x5A, sizeof name); }

  Hb_Rc call(EVMONHandler& handler) { return handler.handler(&events, name, group.get(), &seqnum); }
  bool is_empty_event() const { return events == 0 && seqnum == 0 && std::strcmp(name, "<EMPTY EVENT>") == 0; }
  bool is_untouched() const {
    const Handler_Outputs fresh;
    return events == fresh.events && seqnum == fresh.seqnum && std::memcmp(name, fresh.name, sizeof name) == 0 &&
           same_bytes(*group, *fresh.group);
  }
};

}  // namespace hb_test
