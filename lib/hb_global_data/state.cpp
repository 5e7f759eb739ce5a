#include "hb_global_data/state.h"

Hb_Boolean client_initialized = Hb_False;
Hb_Boolean IsVEX = Hb_False;
int32_t global_hb_errno = 0;

Hb_Configuration_Internal global_config_tbl = {};
Hb_Configuration_Internal global_config_tbl_new = {};
Hb_Boolean global_node_tbl[HB_MAX_NODES] = {};
int32_t global_num_nodes = 0;
Hb_Boolean global_site_tbl[HB_MAX_SITES] = {};
int32_t global_num_sites = 0;

namespace {

constexpr Hb_IP_address6 all_ones_address() {
  Hb_IP_address6 address = {};
  address.v4_in_v6 = {{0xFFFFFFFFU, 0xFFFFFFFFU, 0xFFFFFFFFU}, 0xFFFFFFFFU};
  return address;
}

}  // namespace

Hb_Adapter HB_INVALID_ADAP = {all_ones_address(), HB_NO_NETWORK, "un", HB_NO_ADAPTER, Hb_Entity_Undef};

Hb_memory_configuration_data* data_for_client = nullptr;
Hb_route_sequence* shared_route_info = nullptr;
const Hb_route_sequence* attached_routes = nullptr;
uint32_t attached_route_count = 0;
Hb_security_information* security_info = nullptr;
int shm_id[3] = {};
int shm_sem_id = 0;

zu_vex_net_intf_info_t* global_boot_ip_list = nullptr;
zu_vex_net_intf_info_t* global_vex_net_intf_tbl = nullptr;

pthread_mutex_t global_boot_ip_list_mutex;
pthread_mutex_t event_queue_list_and_sequence_mutex;
pthread_once_t hbapi_global_data_once = PTHREAD_ONCE_INIT;

Hb_Name nodeEventSubscriptionName = {};
Hb_Name networkEventSubscriptionName = {};
Hb_Name siteEventSubscriptionName = {};
Hb_Name splitMergeEventSubscriptionName = {};

int hb_get_errno(void) { return global_hb_errno; }

void set_hb_errno(int error) { global_hb_errno = error; }
