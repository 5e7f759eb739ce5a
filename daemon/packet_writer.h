/* Bytes of answers and events. */
#ifndef HBD_PACKET_WRITER_H
#define HBD_PACKET_WRITER_H

#include "cluster.h"
#include "event.h"
#include "frame.h"
#include "hb_client/control.h"
#include "hb_client/route.h"

namespace hbd {

/** The event as it is sent; groups and configuration are those of the cluster as it stands. */
SharedFrame event_frame(const Event& event, const Cluster& cluster);

/** The answer to a request for the configuration. */
SharedFrame configuration_frame(const Cluster& cluster);

/** An answer without a message. */
SharedFrame answer_frame(Hb_Client_Reply kind, std::int32_t value);

/** An answer with an adapter's state. */
SharedFrame state_frame(std::int32_t status, Hb_Adapter_state_t state);

/** An answer with a route. */
SharedFrame route_frame(std::uint16_t length, const Hb_Source_Route& hops);

}  // namespace hbd

#endif
