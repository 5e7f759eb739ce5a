/* VEX mode: configuration and liveness from the operating system's cluster services instead of a daemon. */
#ifndef HB_CLIENT_VEX_H
#define HB_CLIENT_VEX_H

#include "hb_client/types.h"

HB_BEGIN_DECLS

/**
 * The mode: `Hb_False`, the value at program start, for the daemon, anything else for VEX mode.
 *
 * Set it before hb_init(). hb_terminate() sets it back to `Hb_False` after a start that succeeded; after one that
 * failed, set it back yourself.
 */
extern HB_API Hb_Boolean IsVEX;

/**
 * Starts the client and opens the monitors. Call it in VEX mode before the descriptors are asked for.
 *
 * Where the platform has no monitors there is nothing to open, and that is a success. When a monitor cannot be opened
 * or a pipe cannot be made, nothing stays open.
 *
 * @return `Hb_Success`, or `Hb_Failure` as hb_init() does, with `HB_ENOMEM`, or without an error number when a monitor
 * could not be opened or a pipe not be made.
 */
HB_API Hb_Rc hb_initialize_evmon_event_handlers(void);

/** Closes the monitors and their descriptors. Events that wait stay in their queue. */
HB_API void hb_delete_evmon_event_handlers(void);

/** The same, but for the monitor of the peer group-services daemon. */
HB_API void hb_delete_evmon_event_handlers_except_brix_monitor(void);

/**
 * Tells the client that the group-services daemon of a node was heard of: a node that was taken down with its daemon
 * comes back, by an event that is taken from the descriptors as any other.
 *
 * @return `Hb_Success`, or `Hb_Failure` as hb_init() does, with `HB_ENOPIPEHANDLER` (there are no monitors), or
 * `HB_EEVENTPIPE` (the caller could not be woken). Without memory for the event there is none, which is a success.
 */
HB_API Hb_Rc hb_vex_msg_received_from(Hb_Node_Number node);

/**
 * Has the daemon stop some time later, when its clients have left it. No answer.
 *
 * @return `Hb_Success`, or `Hb_Failure` as hb_init() does or with a send error.
 */
HB_API Hb_Rc hb_vex_delayed_daemon_shutdown(void);

/**
 * Reads the boot addresses anew, and tells by events which adapters and nodes that adds and takes away. The new
 * configuration is in force when the function returns, unless something was taken away: it then is when the
 * configuration event behind the deaths is taken. Nothing changes where there are no monitors.
 */
HB_API void hb_refresh_boot_ip_addrs_and_update_events(void);

HB_END_DECLS

#endif
