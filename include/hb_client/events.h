/* Waiting for events and taking them, one per call. */
#ifndef HB_CLIENT_EVENTS_H
#define HB_CLIENT_EVENTS_H

#include "hb_client/group.h"
#include "hb_client/types.h"

HB_BEGIN_DECLS

/** Bits of `Hb_Events`: what an event says, and what a subscription asks for. */
enum Hb_Event_Bits {
  HB_EVENT_NONE = 0,                /**< empty event, named "<EMPTY EVENT>": nothing happened that is subscribed to */
  HB_EVENT_DEATH = 1,               /**< adapters or nodes left the group */
  HB_EVENT_JOIN = 2,                /**< adapters or nodes joined it */
  HB_EVENT_NEW_GROUP = 4,           /**< a complete group, with leader and status */
  HB_EVENT_FFDC_ID = 8,             /**< a failure-data identifier; not subscribed to */
  HB_EVENT_SITE_SPLIT = 32,         /**< a site was separated */
  HB_EVENT_SITE_MERGE = 64,         /**< a site came back */
  HB_EVENT_SITES = 0x60,            /**< both site events; subscribes to all sites */
  HB_EVENT_CONFIGURATION = 128,     /**< the configuration changed; always delivered, never subscribed to */
  HB_EVENT_DIFF_INSTANCE = 0x100,   /**< a sender runs another configuration instance */
  HB_EVENT_NODE_HEARTBEAT = 0x200,  /**< the daemon's settings for the client's heartbeat */
  HB_EVENT_SUBCLUSTER_SPLIT = 4096, /**< the cluster was split (VEX mode) */
  HB_EVENT_SUBCLUSTER_MERGE = 8192, /**< the cluster was merged (VEX mode) */
  HB_EVENT_SPLIT_MERGE = 0x3000,    /**< both of them */
  HB_EVENT_ALIAS = 16384,           /**< an alias interface came or went (VEX mode) */
  HB_EVENT_SUBSCRIBABLE = 0x7377    /**< every bit that hb_subscribe() takes */
};

/**
 * Takes one event from the daemon, or in VEX mode from the monitors.
 *
 * @param descriptors array that ends with -1: in daemon mode the one from hb_get_file_descriptor_array(), in VEX
 *   mode those of its descriptors that are ready. An array that starts with -1 fails without an error number.
 * @param timeout longest wait in daemon mode, relative; null waits without limit. It is not changed.
 * @param events receives the event bits.
 * @param name receives the name of the subscription, at least 32 bytes, terminated where it is written. A configuration
 *   update is named "Hb_Config_Group", a failure-data identifier "Hb_FFDC_Group". In VEX mode some notifications write
 *   neither name nor sequence number, that of an alias and those that say nothing among them: fill both before.
 * @param group receives who is concerned; read it with the accessors of hb_client/group.h. A configuration update
 *   and a heartbeat event leave its membership as it was.
 * @param seqnum_p receives the daemon's number of the event, as sent. In VEX mode 0, or of a node's death and return
 *   and of a split and a merge the low 32 bits of the report's number.
 *
 * A configuration update replaces the configuration that the queries of hb_client/configuration.h read; one that
 * is not usable is refused and the old one stays.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (a null pointer; nothing was taken), `HB_ENOTREADY`,
 * `HB_ECOMM`, `HB_EDAEMONGONE`, `HB_EBADREPLY` (a packet that is no event or not whole; it is lost), `HB_ENOMEM`,
 * or in VEX mode `HB_ENOPIPEHANDLER`, `HB_EDISPATCH`, `HB_EMONITOR_READ`, `HB_EVEXTBL_BUILD`, `HB_EVEXTBL_ENTRY`,
 * `HB_EVEXTBL_INTF`, `HB_EVEXTBL_COPY`, `HB_EVEXGROUP`, or `HB_EEVENTPIPE`: with that one the outputs are an event that
 * was delivered, and only the wake-up for the next failed. A monitor that cannot be read fails without an error number.
 */
HB_API Hb_Rc hb_get_event_message(int* descriptors, struct timeval* timeout, Hb_Events* events, char* name,
                                  Hb_Group* group, Hb_Seq_Num* seqnum_p);

/**
 * The descriptors to poll for input before hb_get_event_message().
 *
 * @param descriptor receives a new array that ends with -1, to be given back with hb_free_file_descriptor_array().
 * @param numbers_of_fds receives how many descriptors stand before the -1: 1 in daemon mode.
 * @return `Hb_Success`, or `Hb_Failure` when hb_init() fails (its error number stands) or `descriptor` or
 * `numbers_of_fds` is null (no error number), or with `HB_ENOMEM`, or
 * with `HB_ECOMM` when the connection was dropped.
 */
HB_API Hb_Rc hb_get_file_descriptor_array(int** descriptor, int* numbers_of_fds);

/**
 * Releases an array of hb_get_file_descriptor_array(); its descriptors stay open.
 *
 * @return `Hb_Success`, or `Hb_Failure` without an error number when it is null.
 */
HB_API Hb_Rc hb_free_file_descriptor_array(int* descriptors);

HB_END_DECLS

#endif
