/* Records of the control family: the client's heartbeat settings and an adapter's monitoring state. */
#ifndef HB_CLIENT_CONTROL_H
#define HB_CLIENT_CONTROL_H

#include <sys/types.h>

#include "hb_client/types.h"

/** What the daemon's monitoring says of a local adapter. */
typedef enum Hb_Adapter_state_t HB_ENUM_BASE {
  Hb_Adapter_Unknown = 1,
  Hb_Adapter_Up = 2,
  Hb_Adapter_Down = 3,
  Hb_Adapter_ifconfig_Down = 4,
  Hb_Adapter_Misconfig = 5,
  Hb_Adapter_Bcast_Misconfig = 6,
  Hb_Adapter_Not_Monitored = 7,
  Hb_Adapter_No_NIM = 8,
  Hb_Adapter_netmon_error = 9,
  Hb_Adapter_Cannot_bind_IP_soc = 10,
  Hb_Adapter_Cannot_open_device = 11,
} Hb_Adapter_state_t;

/** Who controls the network interface monitors. */
typedef enum Hb_nim_manctrl HB_ENUM_BASE {
  HB_NIM_MANCTRL_ENABLE = 1,
  HB_NIM_MANCTRL_DISABLED = 2,
} Hb_nim_manctrl;

/** The heartbeat that the daemon expects of this client, as last reported by it. */
typedef struct Hb_client_hb_info_t {
  zu_timeval32 client_hb_thresh;   /**< longest time between two heartbeats */
  Hb_Boolean client_hb_is_enabled; /**< whether the daemon watches for them */
  pid_t client_hb_daemon_pid;      /**< the daemon's process */
} Hb_client_hb_info_t;

HB_STATIC_ASSERT(sizeof(Hb_client_hb_info_t) == 16, "heartbeat settings are 16 bytes");

#endif
