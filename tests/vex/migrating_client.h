// A client of a daemon, over a scripted cluster that it can be moved to.
#pragma once

#include <poll.h>

#include "VEX_EVMONAdapterEventHandler.h"
#include "hb_client.h"
#include "monitored_cluster.h"
#include "support/fake_daemon.h"

namespace hb_test {

// Nodes 0 to 2 with the addresses 10.2.<node>.0 on en0 and 10.2.<node>.1 on en1, two slots a node; this is node 0.
inline ConfigurationMessage daemons_cluster() {
  ConfigurationMessage message;
  message.local_node(0).max_nodes(3).adapters_per_node(2).network("one").network("two");
  for (uint32_t node = 0; node < 3; ++node) {
    const std::string prefix = "10.2." + std::to_string(node) + '.';
    message.adapter(node * 2, prefix + '0', 0, "en0", 1).adapter(node * 2 + 1, prefix + '1', 1, "en1", 1);
  }
  return message;
}

inline void add_scripted_node(uint32_t node) {
  scripted_cluster().nodes.push_back({.number = node});
  for (uint8_t index = 0; index < 2; ++index) {
    scripted_cluster().interfaces.push_back({.node = node,
                                             .name = "en" + std::to_string(index),
                                             .address = scripted_address(2, static_cast<uint8_t>(node), index)});
  }
}

class Migrating_Client {
 public:
  explicit Migrating_Client(const ConfigurationMessage& configuration = daemons_cluster()) {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform(1);
    platform_double().levels = {1, 1, 0};
    connection = start_client(daemon, configuration);
    scripted_cluster().appear();
    for (uint32_t node = 0; node < 3; ++node) add_scripted_node(node);
    scripted_cluster().boot_addresses = scripted_cluster().interfaces;
    set_hb_errno(no_number);
    platform_double().traces.clear();
  }
  ~Migrating_Client() {
    VEX_delete_handlers();
    Monitored_Client::drop_queue();
    empty_global_config_table(&global_config_tbl_new);
    hb_terminate();
    migrate_to_vex_prep = false;
  }
  Migrating_Client(const Migrating_Client&) = delete;
  Migrating_Client& operator=(const Migrating_Client&) = delete;

  // The trial table and the lists of the move are left behind.
  static Hb_Rc prepare() {
    const LeakAllowed trial_stays;
    return hb_migrate_to_vex_prep();
  }
  static Hb_Rc commit() {
    const LeakAllowed lists_stay;
    return hb_migrate_to_vex_commit();
  }

  static std::vector<int> descriptors() {
    int* array = nullptr;
    int count = 0;
    if (hb_get_file_descriptor_array(&array, &count) != Hb_Success) return {-2};
    std::vector<int> found(array, array + count);
    hb_free_file_descriptor_array(array);
    return found;
  }

  // What is readable now.
  static std::vector<int> readable() {
    std::vector<int> ready;
    for (const int descriptor : descriptors()) {
      pollfd waiting = {descriptor, POLLIN, 0};
      if (poll(&waiting, 1, 0) == 1) ready.push_back(descriptor);
    }
    return ready;
  }

  static size_t handlers() {
    size_t count = 0;
    for (const void* handler : std::initializer_list<const void*>{
             node_liveness_handler_p, peer_GS_liveness_handler_p, adapter_event_handler_p, new_group_event_handler_p,
             event_pipe_handler_p, ip_change_handler_p, node_list_handler_p, site_config_handler_p,
             split_merge_handler_p, cluster_reconfig_handler_p}) {
      count += handler != nullptr ? 1 : 0;
    }
    return count;
  }

  bool daemon_is_followed() { return IsVEX == Hb_False && client_socket_works(); }

  FakeDaemon daemon;
  DaemonConnection connection;

 private:
  static void VEX_delete_handlers() { hb_delete_evmon_event_handlers(); }

  // A request arrives.
  bool client_socket_works() {
    return hb_client_heartbeat(3) == Hb_Success && i32_at(connection.receive_request(), 8) == 222;
  }
};

inline constexpr size_t all_handlers = 10;

}  // namespace hb_test
