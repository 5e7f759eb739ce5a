/* Moving a running client from the daemon to VEX mode, in two steps. */
#ifndef HB_CLIENT_MIGRATION_H
#define HB_CLIENT_MIGRATION_H

#include "hb_client/types.h"

HB_BEGIN_DECLS

/**
 * Prepares the move: opens the monitors, and checks that the cluster services know this node by the same number and
 * every node that the daemon knows. The daemon goes on being used.
 *
 * @return `Hb_Success`, or `Hb_Failure`: with `HB_EMIGRATE_PREP` (a monitor could not be opened), `HB_EMIGRATE_TBL`
 * (the services do not know a node), or the error number left alone (another number for this node), the monitors are
 * closed again; with `HB_EVEXTBL_BUILD`, `HB_EVEXTBL_ENTRY` or `HB_EVEXTBL_INTF` (the services do not tell of the
 * cluster, its nodes or its interfaces) they stay open until hb_migrate_to_vex_abort().
 */
HB_API Hb_Rc hb_migrate_to_vex_prep(void);

/**
 * Makes the move: leaves the daemon, sets `IsVEX`, takes the configuration of the cluster services, and tells what that
 * changes by events.
 *
 * @return `Hb_Success` always. `HB_EMIGRATE_EVENTS` is left as the error number when there are no monitors; there is
 * no new configuration and no event then.
 */
HB_API Hb_Rc hb_migrate_to_vex_commit(void);

/** Undoes the preparation: closes the monitors. @return `Hb_Success` always. */
HB_API Hb_Rc hb_migrate_to_vex_abort(void);

HB_END_DECLS

#endif
