#include "hb_global_data/vex_handler_set.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>

#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_EVMONIPChangeEventHandler.h"
#include "VEX_EVMONNewGroupEventHandler.h"
#include "VEX_EVMONNodeListHandler.h"
#include "VEX_EVMONNodeLivenessHandler.h"
#include "VEX_EVMONPeerGSLivenessHandler.h"
#include "VEX_EVMONReconfigEventHandler.h"
#include "VEX_EVMONSiteConfigEventHandler.h"
#include "VEX_EVMONSplitMergeEventHandler.h"
#include "hb_client/lifecycle.h"
#include "hb_client/vex.h"
#include "hb_global_data/state.h"

char* evmon_cluster_name = nullptr;

EVMONAdapterEventHandler* adapter_event_handler_p = nullptr;
EVMONEventPipeHandler* event_pipe_handler_p = nullptr;
EVMONIPChangeEventHandler* ip_change_handler_p = nullptr;
EVMONNewGroupEventHandler* new_group_event_handler_p = nullptr;
EVMONNodeListHandler* node_list_handler_p = nullptr;
EVMONNodeLivenessHandler* node_liveness_handler_p = nullptr;
EVMONPeerGSLivenessHandler* peer_GS_liveness_handler_p = nullptr;
EVMONReconfigEventHandler* cluster_reconfig_handler_p = nullptr;
EVMONSiteConfigEventHandler* site_config_handler_p = nullptr;
EVMONSplitMergeEventHandler* split_merge_handler_p = nullptr;

namespace {

constexpr int monitors_are_absent = -1;

enum class Creation { made, absent, failed };

// Keeps the handler when it has a descriptor.
template <typename Handler>
Creation keep(Handler*& slot, std::unique_ptr<Handler> handler) {
  if (handler == nullptr) {
    set_hb_errno(HB_ENOMEM);
    return Creation::failed;
  }
  if (handler->getFileDescriptor() == -1) {
    return handler->getVEXEVMOpenRCInConstructor() == monitors_are_absent ? Creation::absent : Creation::failed;
  }
  slot = handler.release();
  return Creation::made;
}

template <auto& Slot>
Creation open_monitor(char* path) {
  using Handler = std::remove_pointer_t<std::remove_reference_t<decltype(Slot)>>;
  if (Slot != nullptr) {
    return Creation::made;
  }
  return keep(Slot, std::unique_ptr<Handler>(new (std::nothrow) Handler(path)));
}

struct Monitor {
  char path[40];
  Creation (*open)(char* path);
};

// The handlers arm what they open with the initialisation string of their kind.
Monitor monitors[] = {
    {"/var/ha/evmon/node_liveness", open_monitor<node_liveness_handler_p>},
    {"/var/ha/evmon/adapter_liveness", open_monitor<adapter_event_handler_p>},
    {"/var/ha/evmon/ip_change", open_monitor<ip_change_handler_p>},
    {"/var/ha/evmon/node_list", open_monitor<node_list_handler_p>},
    {"/var/ha/evmon/site_config", open_monitor<site_config_handler_p>},
    {"/var/ha/evmon/split_merge", open_monitor<split_merge_handler_p>},
    {"/var/ha/evmon/cluster_reconfig", open_monitor<cluster_reconfig_handler_p>},
    {"/var/ha/evmon/peer_gs_liveness", open_monitor<peer_GS_liveness_handler_p>},
};

bool never_waits(int descriptor) { return fcntl(descriptor, F_SETFL, O_NONBLOCK) == 0; }

class Pipe {
 public:
  Pipe() { is_open_ = pipe2(ends_, O_CLOEXEC) == 0; }
  ~Pipe() {
    if (is_open_) {
      close(ends_[0]);
      close(ends_[1]);
    }
  }
  Pipe(const Pipe&) = delete;
  Pipe& operator=(const Pipe&) = delete;

  bool is_open() const { return is_open_; }
  int read_end() const { return ends_[0]; }
  int write_end() const { return ends_[1]; }

  // A handler that owns both ends from then on.
  template <typename Handler>
  std::unique_ptr<Handler> hand_over() {
    std::unique_ptr<Handler> handler(new (std::nothrow) Handler(ends_, nullptr));
    is_open_ = is_open_ && handler == nullptr;
    return handler;
  }

 private:
  int32_t ends_[2] = {-1, -1};
  bool is_open_;
};

bool make_event_pipe() {
  if (event_pipe_handler_p != nullptr) {
    return true;
  }
  Pipe pipe;
  return pipe.is_open() && never_waits(pipe.read_end()) && never_waits(pipe.write_end()) &&
         keep(event_pipe_handler_p, pipe.hand_over<EVMONEventPipeHandler>()) == Creation::made;
}

bool make_new_group_pipe() {
  if (new_group_event_handler_p != nullptr) {
    return true;
  }
  Pipe pipe;
  return pipe.is_open() && never_waits(pipe.write_end()) &&
         keep(new_group_event_handler_p, pipe.hand_over<EVMONNewGroupEventHandler>()) == Creation::made;
}

struct Release_Cluster_Info {
  void operator()(zu_vex_cluster_info_t* info) const { zu_vex_free_cluster_info(info); }
};

bool learn_cluster_name() {
  zu_vex_cluster_info_t* answer = nullptr;
  if (evmon_cluster_name != nullptr || zu_vex_get_cluster_info(&answer) != 0) {
    return true;
  }
  const std::unique_ptr<zu_vex_cluster_info_t, Release_Cluster_Info> info(answer);
  if (info == nullptr || info->p_cluster_name == nullptr) {
    return true;
  }
  const size_t size = std::strlen(info->p_cluster_name) + 1;
  evmon_cluster_name = new (std::nothrow) char[size];
  if (evmon_cluster_name == nullptr) {
    set_hb_errno(HB_ENOMEM);
    return false;
  }
  std::memcpy(evmon_cluster_name, info->p_cluster_name, size);
  return true;
}

Creation open_first_monitor() {
  EVMONHandler::absence_is_no_error = true;
  const Creation creation = monitors[0].open(monitors[0].path);
  EVMONHandler::absence_is_no_error = false;
  return creation;
}

bool open_other_monitors() {
  return std::all_of(std::begin(monitors) + 1, std::end(monitors),
                     [](Monitor& monitor) { return monitor.open(monitor.path) == Creation::made; });
}

template <typename Handler>
void remove(Handler*& slot) {
  delete slot;
  slot = nullptr;
}

}  // namespace

Hb_Rc VEX_create_global_event_handlers_internal() {
  const Creation first = open_first_monitor();
  if (first == Creation::absent) {
    return Hb_Success;
  }
  const bool is_complete = first == Creation::made && open_other_monitors() && make_event_pipe() &&
                           make_new_group_pipe() && learn_cluster_name();
  return is_complete ? Hb_Success : Hb_Failure;
}

Hb_Rc VEX_create_global_event_handlers() {
  const Hb_Rc rc = VEX_create_global_event_handlers_internal();
  if (rc != Hb_Success) {
    VEX_delete_global_event_handlers();
  }
  return rc;
}

Hb_Rc hb_initialize_evmon_event_handlers(void) {
  return hb_init() == Hb_Success ? VEX_create_global_event_handlers() : Hb_Failure;
}

void VEX_delete_global_event_handlers_except_brix_monitor() {
  delete[] evmon_cluster_name;
  evmon_cluster_name = nullptr;
  remove(node_liveness_handler_p);
  remove(adapter_event_handler_p);
  remove(new_group_event_handler_p);
  remove(cluster_reconfig_handler_p);
  remove(event_pipe_handler_p);
  remove(ip_change_handler_p);
  remove(node_list_handler_p);
  remove(site_config_handler_p);
  remove(split_merge_handler_p);
}

void VEX_delete_global_event_handlers() {
  VEX_delete_global_event_handlers_except_brix_monitor();
  remove(peer_GS_liveness_handler_p);
}

void hb_delete_evmon_event_handlers(void) { VEX_delete_global_event_handlers(); }

void hb_delete_evmon_event_handlers_except_brix_monitor(void) {
  VEX_delete_global_event_handlers_except_brix_monitor();
}
