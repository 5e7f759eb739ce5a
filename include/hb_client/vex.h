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

HB_END_DECLS

#endif
