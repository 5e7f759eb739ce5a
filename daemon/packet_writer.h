/* Bytes of answers and events. */
#ifndef HBD_PACKET_WRITER_H
#define HBD_PACKET_WRITER_H

#include "cluster.h"
#include "event.h"
#include "frame.h"

namespace hbd {

/** The event as it is sent; groups and configuration are those of the cluster as it stands. */
SharedFrame event_frame(const Event& event, const Cluster& cluster);

/** The answer to a request for the configuration. */
SharedFrame configuration_frame(const Cluster& cluster);

/** An answer without a message. */
SharedFrame answer_frame(Hb_Client_Reply kind, std::int32_t value);

}  // namespace hbd

#endif
