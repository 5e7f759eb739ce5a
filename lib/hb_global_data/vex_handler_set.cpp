#include "hb_global_data/vex_handler_set.h"

#include <algorithm>
#include <memory>
#include <new>
#include <utility>

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
#include "hb_global_data/start_up.h"
#include "platform/Pipe.h"
#include "text_copy.h"
#include "vex_platform_records.h"

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

enum class Creation { made, absent, failed };

// Keeps the handler when it has a descriptor.
template <typename Handler>
bool keep(Handler*& slot, std::unique_ptr<Handler> handler) {
  if (handler == nullptr) {
    set_hb_errno(HB_ENOMEM);
    return false;
  }
  if (handler->getFileDescriptor() == -1) {
    return false;
  }
  slot = handler.release();
  return true;
}

template <auto& Slot>
Creation open_monitor(char* path) {
  using Handler = std::remove_pointer_t<std::remove_reference_t<decltype(Slot)>>;
  if (Slot != nullptr) {
    return Creation::made;
  }
  std::unique_ptr<Handler> handler(new (std::nothrow) Handler(path));
  if (handler != nullptr && handler->getVEXEVMOpenRCInConstructor() == VEX_monitors_are_absent) {
    return Creation::absent;
  }
  return keep(Slot, std::move(handler)) ? Creation::made : Creation::failed;
}

// The path can be changed: the handlers take it as `char*`, which they only read.
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

// The handler owns both ends from then on.
template <typename Handler>
std::unique_ptr<Handler> hand_over(Pipe& pipe) {
  std::unique_ptr<Handler> handler(new (std::nothrow) Handler(pipe.ends(), nullptr));
  if (handler != nullptr) {
    pipe.hand_over();
  }
  return handler;
}

bool make_event_pipe() {
  if (event_pipe_handler_p != nullptr) {
    return true;
  }
  Pipe pipe;
  return pipe.is_open() && pipe.read_without_waiting() && pipe.write_without_waiting() &&
         keep(event_pipe_handler_p, hand_over<EVMONEventPipeHandler>(pipe));
}

bool make_new_group_pipe() {
  if (new_group_event_handler_p != nullptr) {
    return true;
  }
  Pipe pipe;
  return pipe.is_open() && pipe.write_without_waiting() &&
         keep(new_group_event_handler_p, hand_over<EVMONNewGroupEventHandler>(pipe));
}

bool learn_cluster_name() {
  zu_vex_cluster_info_t* answer = nullptr;
  if (evmon_cluster_name != nullptr || zu_vex_get_cluster_info(&answer) != 0) {
    return true;
  }
  const Cluster_Answer info(answer);
  if (info == nullptr || info->p_cluster_name == nullptr) {
    return true;
  }
  evmon_cluster_name = new_copy_of(info->p_cluster_name);
  if (evmon_cluster_name == nullptr) {
    set_hb_errno(HB_ENOMEM);
    return false;
  }
  return true;
}

// One that is open shows that the platform has monitors.
bool is_a_monitor_open() {
  EVMONHandler* const handlers[] = {
      adapter_event_handler_p,    ip_change_handler_p,        node_list_handler_p,   node_liveness_handler_p,
      peer_GS_liveness_handler_p, cluster_reconfig_handler_p, site_config_handler_p, split_merge_handler_p,
  };
  return std::any_of(std::begin(handlers), std::end(handlers),
                     [](EVMONHandler* each) { return each != nullptr && each->getFileDescriptor() != -1; });
}

// Whether the absence of all monitors is an error to be traced, in its scope.
class Absence_Allowed {
 public:
  explicit Absence_Allowed(bool allowed) : before_(std::exchange(EVMONHandler::absence_is_no_error, allowed)) {}
  ~Absence_Allowed() { EVMONHandler::absence_is_no_error = before_; }
  Absence_Allowed(const Absence_Allowed&) = delete;
  Absence_Allowed& operator=(const Absence_Allowed&) = delete;

 private:
  const bool before_;
};

// A monitor that is missed where another one is open is as one that cannot be opened.
Creation open(Monitor& monitor) {
  const bool may_be_absent = !is_a_monitor_open();
  const Absence_Allowed allowed(may_be_absent);
  const Creation creation = monitor.open(monitor.path);
  return creation == Creation::absent && !may_be_absent ? Creation::failed : creation;
}

// Up to the first one that was not made.
Creation open_monitors() {
  for (Monitor& monitor : monitors) {
    const Creation creation = open(monitor);
    if (creation != Creation::made) {
      return creation;
    }
  }
  return Creation::made;
}

template <typename Handler>
void remove(Handler*& slot) {
  delete slot;
  slot = nullptr;
}

}  // namespace

Hb_Rc VEX_create_global_event_handlers_internal() {
  make_mutex_once();
  const Creation opened = open_monitors();
  if (opened == Creation::absent) {
    return Hb_Success;
  }
  const bool is_complete =
      opened == Creation::made && make_event_pipe() && make_new_group_pipe() && learn_cluster_name();
  return is_complete ? Hb_Success : Hb_Failure;
}

Hb_Rc VEX_create_global_event_handlers() {
  make_mutex_once();
  const Hb_Rc rc = VEX_create_global_event_handlers_internal();
  if (rc != Hb_Success) {
    VEX_delete_global_event_handlers();
  }
  return rc;
}

Hb_Rc hb_initialize_evmon_event_handlers(void) {
  make_mutex_once();
  return hb_init() == Hb_Success ? VEX_create_global_event_handlers() : Hb_Failure;
}

void VEX_delete_global_event_handlers_except_brix_monitor() {
  make_mutex_once();
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
