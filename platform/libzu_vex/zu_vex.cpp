// A platform without cluster services and event monitors: every call yields -1.
#include "zu_vex.h"

namespace {
constexpr int absent = -1;
}

int zu_vex_get_cluster_info(zu_vex_cluster_info_t** /*info*/) { return absent; }
int zu_vex_get_net_intf_info(zu_vex_net_intf_info_t** /*list*/) { return absent; }
int zu_vex_get_boot_addrs(zu_vex_net_intf_info_t** /*list*/) { return absent; }
