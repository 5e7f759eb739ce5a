/*
 * libhb_client: the liveness of a cluster's nodes, network adapters and sites.
 *
 * A program subscribes, waits on the descriptors that the library hands out, and takes one event per call:
 *
 *   hb_subscribe                    what to follow
 *   hb_get_file_descriptor_array    what to poll
 *   hb_get_event_message            one event
 *   hb_get_next_adapter, ...        who is in it
 *
 * Operations return `Hb_Success` or `Hb_Failure`; after a failure hb_get_errno() tells why. None of them throws,
 * starts a thread or changes how signals are handled. A program that goes on after its daemon is gone ignores
 * SIGPIPE, which VEX mode does not raise. One thread at a time may drive the library.
 */
#ifndef HB_CLIENT_H
#define HB_CLIENT_H

#include "hb_client/configuration.h"
#include "hb_client/control.h"
#include "hb_client/error.h"
#include "hb_client/events.h"
#include "hb_client/group.h"
#include "hb_client/lifecycle.h"
#include "hb_client/migration.h"
#include "hb_client/route.h"
#include "hb_client/security.h"
#include "hb_client/subscription.h"
#include "hb_client/types.h"
#include "hb_client/vex.h"

#endif
