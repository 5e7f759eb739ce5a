#include "vex_tables.h"

#include <netinet/in.h>
#include <unistd.h>

#include <cstring>
#include <deque>
#include <memory>
#include <stdexcept>
#include <string>

#include "VEX_EVMONConfigurationHandler.h"
#include "VEX_EVMONEventPipeHandler.h"
#include "hb_communication/vex_table_build.h"

namespace bench {
namespace {

constexpr uint32_t first_address = 0x0A000000;  // 10.0.0.0

// Everything that the services say, made once and never changed.
class Services {
 public:
  Services() {
    for (uint32_t node = HB_MAX_NODES; node-- > 0;) add_node(node);
    cluster_.local_node_number = 0;
  }

  zu_vex_cluster_info_t* cluster() { return &cluster_; }
  zu_vex_node_info_t* nodes() { return nodes_.empty() ? nullptr : &nodes_.back(); }
  zu_vex_net_intf_info_t* interfaces() { return interfaces_.empty() ? nullptr : &interfaces_.back(); }

 private:
  void add_node(uint32_t number) {
    zu_vex_node_info_t node = {};
    node.number = number;
    node.status = ZU_VEX_NODE_STATUS_UP;
    node.p_next = nodes();
    nodes_.push_back(node);
    for (uint32_t index = HB_MAX_NETWORKS; index-- > 0;) add_interface(number, index);
  }
  void add_interface(uint32_t node, uint32_t index) {
    zu_vex_net_intf_info_t interface = {};
    interface.ip_addr.zu_vex_v4_in_v6 = {{0, 0, htonl(0xFFFF)}, htonl(first_address + node * HB_MAX_NETWORKS + index)};
    interface.node_number = node;
    interface.p_name = names_.emplace_back("en" + std::to_string(index)).data();
    interface.status = ZU_VEX_INTF_STATUS_UP;
    interface.p_next = interfaces();
    interfaces_.push_back(interface);
  }

  zu_vex_cluster_info_t cluster_ = {};
  std::deque<zu_vex_node_info_t> nodes_;
  std::deque<zu_vex_net_intf_info_t> interfaces_;
  std::deque<std::string> names_;
};

Services& services() {
  static Services instance;
  return instance;
}

void build(Hb_Configuration_Internal& table) {
  if (hb_vex_update_global_tbl(&table, nullptr, nullptr, nullptr) != Hb_Success) {
    throw std::runtime_error("the table was not built");
  }
}

EVMONConfigurationHandler& comparer() {
  static char path[] = "/";
  static EVMONConfigurationHandler handler(path, nullptr);
  return handler;
}

std::unique_ptr<Hb_Group>& callers_group() {
  static auto group = std::make_unique<Hb_Group>();
  return group;
}

}  // namespace

const zu_vex_net_intf_info_t* all_interfaces() { return services().interfaces(); }

void build_new_table() { build(global_config_tbl_new); }
void release_new_table() { empty_global_config_table(&global_config_tbl_new); }

void fill_both_tables() {
  build(global_config_tbl);
  build(global_config_tbl_new);
}

void release_both_tables() {
  empty_global_config_table(&global_config_tbl);
  release_new_table();
}

const Hb_Adapter* adapters_in_force() { return global_config_tbl.Hb_global_adapter_list; }

int compare_tables() {
  Hb_VEX_Event* events[5] = {};
  comparer().compare_global_config_tables(&global_config_tbl_new, &events[0], &events[1], &events[2], &events[3],
                                          &events[4]);
  int count = 0;
  for (const Hb_VEX_Event* event : events) {
    count += event != nullptr ? 1 : 0;
    delete event;
  }
  return count;
}

Event_Delivery::Event_Delivery() {
  build(global_config_tbl);
  std::strcpy(networkEventSubscriptionName, "adapters");
  int32_t ends[2] = {-1, -1};
  if (pipe(ends) != 0) throw std::runtime_error("no pipe");
  char label[] = "events";
  event_pipe_handler_p = new EVMONEventPipeHandler(ends, label);
}

Event_Delivery::~Event_Delivery() {
  delete event_pipe_handler_p;
  event_pipe_handler_p = nullptr;
  empty_global_config_table(&global_config_tbl);
}

void Event_Delivery::deliver_one() {
  Hb_VEX_Event* event = nullptr;
  event_pipe_handler_p->construct_an_adapter_event(&event, HB_EVENT_DEATH, 1);
  VEX_add_event_at_end(event);
  VEX_write_to_event_pipe();
  Hb_Events events = 0;
  Hb_Name name = {};
  Hb_Seq_Num sequence = 0;
  event_pipe_handler_p->handler(&events, name, callers_group().get(), &sequence);
  if (events != HB_EVENT_DEATH) throw std::runtime_error("the event was not delivered");
}

}  // namespace bench

// The services in the place of the platform's. What they hand out stays theirs.

int zu_vex_get_cluster_info(zu_vex_cluster_info_t** info) {
  *info = bench::services().cluster();
  return 0;
}

int zu_vex_get_node_info(zu_vex_node_info_t** list) {
  *list = bench::services().nodes();
  return 0;
}

int zu_vex_get_node_info_after_event(const zu_evm_event_metadata_t* /*event*/, zu_vex_node_info_t** list) {
  return zu_vex_get_node_info(list);
}

int zu_vex_get_net_intf_info(zu_vex_net_intf_info_t** list) {
  *list = bench::services().interfaces();
  return 0;
}

int zu_vex_get_net_intf_info_after_event(const zu_evm_event_metadata_t* /*event*/, zu_vex_net_intf_info_t** list) {
  return zu_vex_get_net_intf_info(list);
}

int zu_vex_get_boot_addrs(zu_vex_net_intf_info_t** list) { return zu_vex_get_net_intf_info(list); }

void zu_vex_free_cluster_info(zu_vex_cluster_info_t* /*info*/) {}
void zu_vex_free_node_info(zu_vex_node_info_t* /*list*/) {}
void zu_vex_free_net_intf_info(zu_vex_net_intf_info_t* /*list*/) {}
