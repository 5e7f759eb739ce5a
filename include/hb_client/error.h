/* The library's error number: one for the whole process, set by failures and never cleared by a success. */
#ifndef HB_CLIENT_ERROR_H
#define HB_CLIENT_ERROR_H

#include "hb_client/types.h"

HB_BEGIN_DECLS

/** Values of hb_get_errno(). Numbers that are missing here are never set. */
enum Hb_Error {
  HB_ENOMORE = 1,            /**< an iteration ran past its last entry */
  HB_ENOTREADY = 2,          /**< the time given passed without a packet from the daemon */
  HB_EWRONGSTATE = 3,        /**< the request does not fit the state, or the event does not carry the datum */
  HB_EINVAL = 4,             /**< an argument is out of range or a null pointer */
  HB_EGROUPTYPE = 5,         /**< a group was asked for what only the other kind of group has */
  HB_ENOROUTE = 6,           /**< no route is known for the node */
  HB_ENOADAPTER = 7,         /**< the adapter is not configured, or not in the group */
  HB_ENONETWORK = 8,         /**< the network is not configured */
  HB_ENONODE = 9,            /**< the node has no configured adapter */
  HB_EBADREPLY = 10,         /**< the daemon's packet is of another kind, not whole, or has an unknown status */
  HB_ESUBSCRIBE = 11,        /**< the subscription group's type does not allow the operation */
  HB_ECOMM = 12,             /**< waiting or receiving failed, or there is no connection */
  HB_ESOCKET = 13,           /**< the socket could not be created */
  HB_ESOCKOPT = 14,          /**< a socket buffer size could not be set */
  HB_ECONNECT = 15,          /**< the daemon's socket could not be connected to */
  HB_EDAEMONGONE = 16,       /**< the daemon closed the connection */
  HB_ENOMEM = 17,            /**< memory ran out */
  HB_ESENDFAULT = 18,        /**< sending failed: bad address */
  HB_ESENDWOULDBLOCK = 19,   /**< sending failed: it would block */
  HB_ESENDNOTRESTARTED = 20, /**< sending failed: interrupted */
  HB_ESENDIO = 21,           /**< sending failed: input/output error */
  HB_ESEND = 22,             /**< sending failed otherwise */
  HB_ERECVFAULT = 23,        /**< receiving the configuration failed: bad address */
  HB_ERECVWOULDBLOCK = 24,   /**< receiving the configuration failed: it would block */
  HB_ERECVNOTRESTARTED = 25, /**< receiving the configuration failed: interrupted */
  HB_ERECVIO = 26,           /**< receiving the configuration failed: input/output error */
  HB_ERECV = 27,             /**< receiving the configuration failed otherwise */
  HB_EKEY_CONFIG = 28,       /**< no key for the configuration segment */
  HB_EKEY_ROUTE = 29,        /**< no key for the route segment */
  HB_EKEY_SEM = 30,          /**< no key for the semaphore set */
  HB_ESHMGET_ACCESS = 31,    /**< getting a segment: no permission */
  HB_ESHMGET_INVAL = 32,     /**< getting a segment: its size does not fit */
  HB_ESHMGET_NOENT = 33,     /**< getting a segment: the daemon has not published it */
  HB_ESHMGET_NOMEM = 34,     /**< getting a segment: no memory */
  HB_ESHMGET_LIMIT = 35,     /**< getting a segment: a limit of the system */
  HB_ESHMGET = 36,           /**< getting a segment failed otherwise */
  HB_ESHMAT_ACCESS = 37,     /**< attaching a segment: no permission */
  HB_ESHMAT_INVAL = 38,      /**< attaching a segment: invalid */
  HB_ESHMAT_NOENT = 39,      /**< attaching a segment: it is gone */
  HB_ESHMAT_NOMEM = 41,      /**< attaching a segment: no memory */
  HB_ESHMAT = 42,            /**< attaching a segment failed otherwise */
  HB_ESEMGET_ACCESS = 43,    /**< getting the semaphores: no permission */
  HB_ESEMGET_INVAL = 44,     /**< getting the semaphores: their number does not fit */
  HB_ESEMGET_NOENT = 45,     /**< getting the semaphores: the daemon has not made them */
  HB_ESEMGET_NOMEM = 46,     /**< getting the semaphores: no memory */
  HB_ESEMGET_NOSPC = 47,     /**< getting the semaphores: a limit of the system */
  HB_ESEMGET = 48,           /**< getting the semaphores failed otherwise */
  HB_ENOIPROUTE = 49,        /**< the node's route is not an IP route */
  HB_EBADSERVICEADDR = 50,   /**< the daemon refused the service address */
  HB_ESAMEADDR = 51,         /**< the adapter has that address already */
  HB_ENOTSUPPORTED = 52,     /**< the daemon does not support the request */
  HB_EMSGTOOBIG = 53,        /**< a message for routing is too large */
  HB_EKEY_SECURITY = 54,     /**< no key for the security segment */
  HB_EGRACEFAILED = 55,      /**< the grace period could not be granted */
  HB_EGRACETIMEOUT = 56,     /**< the grace period timed out */
  HB_EMONITOR_READ = 58,     /**< VEX mode: the new-group monitor could not be read */
  HB_EEVENTPIPE = 59,        /**< VEX mode: a pipe could not be written */
  HB_EVEXTBL_BUILD = 63,     /**< VEX mode: the configuration table could not be built */
  HB_EVEXTBL_ENTRY = 64,     /**< VEX mode: an entry of the configuration table could not be made */
  HB_EVEXTBL_INTF = 65,      /**< VEX mode: interface information could not be obtained */
  HB_EVEXGROUP = 68,         /**< VEX mode: the new-group monitor reported a group of unknown kind */
  HB_EVEXTBL_COPY = 70,      /**< VEX mode: the configuration table could not be copied */
  HB_EADAPTERSTATE = 71,     /**< an adapter state outside the known range */
  HB_EPIPEMSG = 72,          /**< VEX mode: an unexpected byte in the event pipe */
  HB_ENODEMISSING = 73,      /**< migration: a node of the old table is missing from the new one */
  HB_EMIGRATE_PREP = 74,     /**< migration: the preparation failed */
  HB_EMIGRATE_TBL = 75,      /**< migration: the table could not be built */
  HB_EDISPATCH = 81,         /**< VEX mode: no handler owns the descriptor */
  HB_ENODESCRIPTORS = 82,    /**< VEX mode: a handler left while none was registered */
  HB_ESITESUB = 84,          /**< the site is not configured */
  HB_ESITECONFIG_READ = 86,  /**< VEX mode: the site monitor could not be read */
  HB_ESITECONFIG_DATA = 87,  /**< VEX mode: the site event could not be processed */
  HB_ESITECONFIG_EVENT = 88, /**< VEX mode: the site event could not be queued */
  HB_ENOGROUPHANDLER = 89,   /**< VEX mode: there is no new-group handler */
  HB_ENOPIPEHANDLER = 90,    /**< VEX mode: there is no event-pipe handler */
  HB_EMIGRATE_EVENTS = 91    /**< migration: table and events could not be built */
};

/**
 * The number of the last failure in this process, 0 before the first one.
 *
 * Read it only after an operation returned `Hb_Failure`; some failures, named where they occur, leave it as it was.
 */
HB_API int hb_get_errno(void);

HB_END_DECLS

#endif
