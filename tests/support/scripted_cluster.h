// A cluster and its event monitors, as a test fills them. The doubles of zu_vex.h and zu_evm.h answer from it. It
// counts what is handed out and given back, and takes no memory from operator new while the library runs.
#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "unfailing_allocator.h"
#include "zu_evm.h"
#include "zu_vex.h"

struct Scripted_Node {
  uint32_t number = 0;
  zu_vex_node_status_t status = ZU_VEX_NODE_STATUS_UP;
  zu_vex_node_down_reason_t reason = ZU_VEX_NODE_DOWN_REASON_NONE;
  std::optional<std::string> name = "node";

  bool operator==(const Scripted_Node&) const = default;
};

struct Scripted_Interface {
  uint32_t node = 0;
  std::optional<std::string> name;
  zu_vex_IP_address6_t address = {};
  zu_vex_intf_status_t status = ZU_VEX_INTF_STATUS_UP;
  uint64_t flags = 0;
};

// 10.a.b.c as an IPv4-mapped address.
zu_vex_IP_address6_t scripted_address(uint8_t a, uint8_t b, uint8_t c);

// What a call yields.
struct Platform_Result {
  int result = -1;
  int error = 0;          // left in `errno` when not 0
  bool as_usual = false;  // what the call yields without a script
};
inline constexpr Platform_Result platform_as_usual = {0, 0, true};

// One call of a query, an open or a read.
struct Platform_Question {
  const char* call;     // the function's name
  int descriptor = -1;  // of a read
  Unfailing_Text path;  // of an open, as is the next; empty for a null one
  Unfailing_Text init_string;
  bool has_metadata = false;  // of a query after an event, as are the next
  int category = 0;
  const void* event = nullptr;
};

enum class Platform_Handout {
  cluster_info,
  node_info,
  net_intf_info,
  node_liveness,
  split_merge,
  adapter_liveness,
  ip_change,
  node_list,
  process_liveness,
  cluster_reconfig,
  repository_disk,
  site_cfg,
};

class Scripted_Cluster {
 public:
  // The cluster. Without services every query yields -1, without monitors every open.
  bool has_services = false;
  bool has_monitors = false;
  uint32_t local_node = 0;
  std::optional<std::string> cluster_name = "scripted";
  std::vector<Scripted_Node> nodes;
  std::vector<Scripted_Interface> interfaces;
  std::vector<Scripted_Interface> boot_addresses;

  // Services and monitors are there.
  void appear() { has_services = has_monitors = true; }

  // Called at each query after an event, before it is answered.
  std::function<void(const zu_evm_event_metadata_t*)> at_query_after_event;

  // Results of the next opens, in order; later ones go as usual.
  std::deque<Platform_Result> open_results;

  // What a read yields when its descriptor is no open monitor, in order; later ones yield -1.
  std::deque<Platform_Result> stray_read_results;

  // Everything that was asked, in order.
  std::vector<Platform_Question, Unfailing_Allocator<Platform_Question>> asked;
  size_t times_asked(const std::string& call) const;

  // Puts a copy of the notification, with its texts and lists, behind those that wait on an open monitor, whose
  // descriptor is readable from then on. It is handed out by the read of its kind; node liveness also delivers splits
  // and merges. Throws std::invalid_argument when the descriptor is no open monitor's.
  void notify(int descriptor, const zu_evm_event_node_liveness_t& record);
  void notify(int descriptor, const zu_evm_event_split_merge_cfg_t& record);
  void notify(int descriptor, const zu_evm_event_adapter_liveness_t& record);
  void notify(int descriptor, const zu_evm_event_ip_change_t& record);
  void notify(int descriptor, const zu_evm_event_node_list_t& list);
  void notify(int descriptor, const zu_evm_event_process_liveness_t& record);
  void notify(int descriptor, const zu_evm_event_cluster_reconfig_t& record);
  void notify(int descriptor, const zu_evm_event_repository_disk_t& record);
  void notify(int descriptor, const zu_evm_event_site_cfg_t& list);

  // The next read behind those that wait yields that result, and with a good one a null record.
  void notify_result(int descriptor, int result, int error = 0);

  // Makes the descriptor readable although nothing waits.
  void wake(int descriptor);

  size_t waiting(int descriptor) const;
  bool is_open_monitor(int descriptor) const;
  // Descriptors of the monitors that are open, in the order of their opening, and the path of one.
  std::vector<int> open_monitors() const;
  std::string path_of(int descriptor) const;

  // A list that can be put into a scripted answer, and is released as others are.
  zu_vex_net_intf_info_t* new_interfaces(const std::vector<Scripted_Interface>& list);
  zu_vex_node_info_t* new_nodes(const std::vector<Scripted_Node>& list);
  zu_vex_cluster_info_t* new_cluster_info();

  // Records that were handed out, and those of them that were not given back yet. Each record of a list counts.
  static size_t handed_out();
  static size_t outstanding();
  static size_t outstanding(Platform_Handout kind);
  // Releases of what is not out: of something released before, of another kind, or of something foreign.
  static size_t wrong_releases();

  // Back to a cluster without services, and counts at 0. What is out stays out.
  void reset();

  // For the doubles alone.
  int open(const char* path, const char* init_string, int* descriptor);
  int read(const char* call, int descriptor, std::initializer_list<Platform_Handout> kinds, void** record,
           Platform_Handout* kind);
  void ask(const char* call, const zu_evm_event_metadata_t* event);
  static void deliver(void* record);
  static void release(void* record, std::initializer_list<Platform_Handout> kinds);

 private:
  struct Waiting {
    std::optional<Platform_Handout> kind;  // none: only a result
    void* record;
    Platform_Result result;
  };
  struct Monitor {
    int descriptor;      // the library's
    uint64_t identity;   // of its file
    int far_descriptor;  // ours
    Unfailing_Text path;
    std::deque<Waiting, Unfailing_Allocator<Waiting>> queue;
  };
  std::deque<Monitor, Unfailing_Allocator<Monitor>> monitors_;

  const Monitor* find(int descriptor) const;
  Monitor* find(int descriptor);
  Monitor& known(int descriptor);
  void put(int descriptor, Waiting waiting);
};

Scripted_Cluster& scripted_cluster();
