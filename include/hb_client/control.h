/* Steering the daemon: local adapters, reports about others, heartbeats, and what the daemon monitors. */
#ifndef HB_CLIENT_CONTROL_H
#define HB_CLIENT_CONTROL_H

#include <stddef.h>
#include <sys/time.h>
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

HB_STATIC_ASSERT(sizeof(Hb_Adapter_state_t) == 4, "adapter states are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_nim_manctrl) == 4, "manual controls are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_client_hb_info_t) == 16, "heartbeat settings are 16 bytes");
HB_STATIC_ASSERT(offsetof(Hb_client_hb_info_t, client_hb_is_enabled) == 8, "whether it is watched at 8");
HB_STATIC_ASSERT(offsetof(Hb_client_hb_info_t, client_hb_daemon_pid) == 12, "the daemon's process at 12");

HB_BEGIN_DECLS

/*
 * Every request starts the client when it is not running, and fails as hb_init() does when that fails. Sending fails
 * with `HB_ECOMM` (no connection), `HB_EDAEMONGONE`, `HB_ENOMEM` or one of the other send errors of hb_client/error.h.
 * In VEX mode nothing is sent, which is no failure; but an answer cannot be awaited there, which is `HB_ECOMM`.
 *
 * A request without an answer succeeds when it was sent. Those with an answer wait for it, 55 seconds at most unless it
 * is said otherwise, and then fail with `HB_ENOTREADY`; with `HB_EDAEMONGONE` or `HB_ECOMM` when it cannot be read, and
 * with `HB_EBADREPLY` when something else comes. An event that comes while an answer is awaited is lost with
 * `HB_EBADREPLY`: take the events first, and read the configuration and the groups anew after that error. No other
 * thread may take events or send requests meanwhile.
 */

/*
 * Requests about an adapter of this node. `HB_EINVAL`: the number is not below the adapters per node times the nodes,
 * or the adapter is another node's. `HB_ENOADAPTER`: it is not configured.
 */

/** Has the daemon monitor the adapter. No answer. */
HB_API Hb_Rc hb_enable_adapter(Hb_Adapter_Number adapter);
/** Has the daemon stop monitoring the adapter. No answer. */
HB_API Hb_Rc hb_disable_adapter(Hb_Adapter_Number adapter);
/** Marks the adapter's interface down. No answer. */
HB_API Hb_Rc hb_ifconfig_down(Hb_Adapter_Number adapter);
/** Marks the adapter's interface up. No answer. */
HB_API Hb_Rc hb_ifconfig_up(Hb_Adapter_Number adapter);

/**
 * Gives the adapter an address and has it monitored. The adapter must be disabled.
 *
 * @param address IPv4, network byte order.
 * Answered: `HB_ENONETWORK` the daemon does not know its network; `HB_EWRONGSTATE` it is enabled; `HB_ENOADAPTER` it is
 * not configured there; `HB_EBADSERVICEADDR` the address is refused; `HB_ESAMEADDR` it has that address already;
 * `HB_EBADREPLY` any other status.
 */
HB_API Hb_Rc hb_configure_adapter(Hb_Adapter_Number adapter, Hb_IP_address4 address);

/**
 * Takes the adapter's address away. The adapter must be disabled.
 *
 * Answered: `HB_ENONETWORK`, `HB_EWRONGSTATE`, `HB_ENOADAPTER` as for hb_configure_adapter(); `HB_EBADREPLY` any other
 * status.
 */
HB_API Hb_Rc hb_unconfigure_adapter(Hb_Adapter_Number adapter);

/**
 * Exchanges the addresses of the adapter and of another one of this node.
 *
 * @param address the other one's IPv4 address, network byte order. Before anything is sent: `HB_ENOADAPTER` no adapter
 *   has it, `HB_EINVAL` its adapter is another node's.
 * Answered: as hb_unconfigure_adapter().
 */
HB_API Hb_Rc hb_swap_adapters(Hb_Adapter_Number adapter, Hb_IP_address4 address);

/**
 * Asks for a time in which the adapter's silence is no death. Waits for the answer without a limit.
 *
 * @param seconds how long.
 * Answered: `HB_ENONETWORK` the daemon does not know its network; `HB_ENOTSUPPORTED`; `HB_EGRACEFAILED` it could not be
 * granted; `HB_EGRACETIMEOUT` granting it timed out; `HB_EBADREPLY` any other status.
 */
HB_API Hb_Rc hb_adapter_grace(Hb_Adapter_Number adapter, int seconds);

/**
 * What the daemon's monitoring says of the adapter.
 *
 * @param state receives it on success; `HB_EINVAL` when null.
 * Answered: `HB_ENONETWORK` the daemon does not know its network; `HB_ENOADAPTER` it is not configured there;
 * `HB_EBADREPLY` any other status, or an answer without a state.
 */
HB_API Hb_Rc hb_get_adapter_state(Hb_Adapter_Number adapter, Hb_Adapter_state_t* state);

/*
 * Reports about any adapter or node of the cluster. No answer. A large number makes a large request: as many bytes as
 * the number says.
 */

/**
 * The adapter does not answer: it is down unless its heartbeat says otherwise soon. `HB_EINVAL`: the number is not
 * below the adapters per node times the nodes. `HB_ENOADAPTER`: it is not configured.
 */
HB_API Hb_Rc hb_adapter_may_be_down(Hb_Adapter_Number adapter);
/** The adapter is down. Fails as hb_adapter_may_be_down(). */
HB_API Hb_Rc hb_adapter_is_down(Hb_Adapter_Number adapter);
/**
 * The node does not answer: it is down unless its heartbeat says otherwise soon. `HB_EINVAL`: the number is negative or
 * not below the nodes. `HB_ENONODE`: no adapter of the node is configured.
 */
HB_API Hb_Rc hb_node_may_be_down(Hb_Node_Number node);
/** The node is down. Fails as hb_node_may_be_down(). */
HB_API Hb_Rc hb_node_is_down(Hb_Node_Number node);

/** Has the daemon behave as if this node had been dead for so many seconds. No answer. */
HB_API Hb_Rc hb_simulate_death(int slept_sec);

/** `Hb_True`: events that went stale before they were delivered are dropped for this client; anything else: they are
 * not. No answer. */
HB_API Hb_Rc hb_discard_stale_messages(Hb_Boolean discard_flag);

/** This client's sign of life, with a number of its own. No answer; see hb_get_client_hb_info(). */
HB_API Hb_Rc hb_client_heartbeat(Hb_Seq_Num seqnum);

/**
 * Switches manual control of network interface monitors on or off. No answer.
 *
 * @param ctrl `HB_NIM_MANCTRL_ENABLE` or `HB_NIM_MANCTRL_DISABLED`, else `HB_EINVAL`.
 * @param interface name of the interface, all of them when empty; `HB_EINVAL` when null or above 16,460 characters.
 */
HB_API Hb_Rc hb_nim_manual_start_control(Hb_nim_manctrl ctrl, char* interface);

/**
 * The heartbeat that the daemon expects of this client, as the last heartbeat event said; zeros before the first one.
 * Asks nobody and starts nothing.
 *
 * @param client_hb_info_p receives it; `HB_EINVAL` when null, the only failure.
 */
HB_API Hb_Rc hb_get_client_hb_info(Hb_client_hb_info_t* client_hb_info_p);

/**
 * For how long a remote node's and this node's death are simulated, from the configuration. Either pointer may be null.
 * Fails as hb_init() does.
 */
HB_API Hb_Rc hb_get_local_rem_sim_node_down_period(struct timeval* sim_rem_node_down_period,
                                                   struct timeval* sim_local_node_down_period);

HB_END_DECLS

#endif
