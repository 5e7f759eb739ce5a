/* Starting and stopping the client. One thread at a time drives the library. */
#ifndef HB_CLIENT_LIFECYCLE_H
#define HB_CLIENT_LIFECYCLE_H

#include "hb_client/types.h"

HB_BEGIN_DECLS

/**
 * Starts the client: connects to the daemon, attaches the memory that it publishes and loads the configuration.
 *
 * Nearly every other operation calls this first, so a program need not. Once it has succeeded it returns at once.
 * The daemon's socket is "/var/ha/soc/mowl/server_socket", or the value of the environment variable
 * HB_SERVER_SOCKET; a non-empty HA_DOMAIN_NAME, or failing that HA_SYSPAR_NAME, is appended after a dot.
 *
 * @return `Hb_Success`, or `Hb_Failure` with one of: `HB_ESOCKET`, `HB_ESOCKOPT`, `HB_ECONNECT` (no daemon, or a
 * path that no socket address can hold), `HB_ENOMEM`, `HB_EKEY_CONFIG`, `HB_EKEY_ROUTE`, `HB_EKEY_SECURITY`,
 * `HB_EKEY_SEM`, one of the `HB_ESHMGET`, `HB_ESHMAT` and `HB_ESEMGET` families, one of the send errors
 * (`HB_ESENDFAULT` to `HB_ESEND`), one of the receive errors (`HB_ERECVFAULT` to `HB_ERECV`), `HB_EDAEMONGONE`, or
 * `HB_EBADREPLY` (the answer is not a usable configuration). In VEX mode on a platform without cluster services
 * it always fails and leaves the error number alone. A start that fails after connecting keeps that connection
 * and what it attached; nothing closes them.
 */
HB_API Hb_Rc hb_init(void);

/**
 * Stops the client: detaches the shared memory, releases the configuration, leaves VEX mode, closes the connection.
 *
 * @return `Hb_Success`, also when the client was not started.
 */
HB_API Hb_Rc hb_terminate(void);

/** hb_terminate() for callers that have no use for its result, such as atexit(). */
HB_API void hb_exit(void);

HB_END_DECLS

#endif
