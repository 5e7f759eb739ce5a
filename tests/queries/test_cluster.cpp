#include "test_cluster.h"

#include <cstring>

#include "VEX_HBC_trace.h"
#include "hb_communication/configuration_load.h"
#include "hb_global_data/node_table.h"
#include "platform_doubles.h"

namespace hb_test {

ConfigurationMessage sparse_cluster() {
  return ConfigurationMessage()
      .local_node(3)
      .max_nodes(8)
      .adapters_per_node(4)
      .adapter(13, "10.0.1.3", 1, "en1", 1)
      .adapter(0, "10.0.0.10", 0, "en0", 1)
      .adapter(12, "10.0.0.3", 0, "en0", 2)
      .adapter(17, "10.0.1.4", 1, "en1", 0)
      .adapter(2, "10.0.3.10", 3, "disk2", 1)
      .network("net_ether_01", "ether")
      .network("net_ether_02", "fast")
      .network("", "")
      .network("net_disk_01", "disk");
}

Hb_IP_address6 address_of(const std::string& text) {
  Hb_IP_address6 address;
  std::memcpy(&address, address_bytes(text).data(), sizeof address);
  return address;
}

Packet packet_of(const Bytes& bytes) {
  char* array = new char[bytes.size()];
  std::memcpy(array, bytes.data(), bytes.size());
  return Packet(array, bytes.size());
}

void load(const ConfigurationMessage& configuration) {
  const Packet packet = packet_of(configuration_answer(configuration));
  hb_get_adapter_network(packet.get());
  hb_init_global_node_tbl();
  client_initialized = Hb_True;
}

void unload() {
  hb_deinit_global_config_and_node_tbl();
  client_initialized = Hb_False;
}

void forget_leftovers() {
  std::memset(global_node_tbl, 0, sizeof global_node_tbl);
  std::memset(global_config_tbl.Hb_global_network_list, 0, sizeof global_config_tbl.Hb_global_network_list);
  std::memset(global_site_tbl, 0, sizeof global_site_tbl);
  global_num_sites = 0;
  global_config_tbl.Hb_max_sites = 0;
  global_config_tbl.Hb_max_nodes = 0;
  global_config_tbl.Hb_adapters_per_node = 0;
}

void Loaded_Client::reload(const ConfigurationMessage& configuration) {
  unload();
  load(configuration);
}

namespace {

void set_trace_levels(const std::vector<uint8_t>& levels) {
  hbc_initialize_trace_once();
  platform_double().set_levels(levels);
  platform_double().traces.clear();
}

}  // namespace

void trace_only(size_t category) {
  std::vector<uint8_t> levels(3, 0);
  levels[category] = 1;
  set_trace_levels(levels);
}

void trace_all() { set_trace_levels({1, 1, 1}); }

void trace_nothing() { set_trace_levels({0, 0, 0}); }

}  // namespace hb_test
