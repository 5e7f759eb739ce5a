// A platform without event monitors: nothing can be opened or read.
#include "zu_evm.h"

namespace {
constexpr int absent = -1;
}

int zu_evm_open(const char* /*path*/, const char* /*init_string*/, int* /*descriptor*/) { return absent; }
int zu_evm_read_node_liveness(int /*descriptor*/, zu_evm_event_node_or_split_merge_cfg_t* /*record*/) { return absent; }
int zu_evm_read_split_merge(int /*descriptor*/, zu_evm_event_split_merge_cfg_t** /*record*/) { return absent; }
int zu_evm_read_adapter_liveness(int /*descriptor*/, zu_evm_event_adapter_liveness_t** /*record*/) { return absent; }
int zu_evm_read_ip_change(int /*descriptor*/, zu_evm_event_ip_change_t** /*record*/) { return absent; }
int zu_evm_read_node_list(int /*descriptor*/, zu_evm_event_node_list_t** /*list*/) { return absent; }
int zu_evm_read_process_liveness(int /*descriptor*/, zu_evm_event_process_liveness_t** /*record*/) { return absent; }
int zu_evm_read_cluster_reconfig(int /*descriptor*/, zu_evm_event_cluster_reconfig_t** /*record*/) { return absent; }
int zu_evm_read_repository_disk(int /*descriptor*/, zu_evm_event_repository_disk_t** /*record*/) { return absent; }
int zu_evm_read_site_cfg(int /*descriptor*/, zu_evm_event_site_cfg_t** /*list*/) { return absent; }

// Nothing is ever handed out.
void zu_evm_free(void* /*record*/) {}
