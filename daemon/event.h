/* What clients are told: the output of the membership model. */
#ifndef HBD_EVENT_H
#define HBD_EVENT_H

#include <string>
#include <variant>
#include <vector>

#include "change.h"
#include "hb_client/types.h"
#include "hb_protocol/replies.h"
#include "member_set.h"

namespace hbd {

enum class Direction { Death, Join };

/** Adapters that left or joined the adapter group. */
struct AdapterEvent {
  Direction direction = Direction::Death;
  std::vector<hb_adapter_event_entry> adapters;
};

/** Nodes that left or joined the node group. */
struct NodeEvent {
  Direction direction = Direction::Death;
  std::vector<Hb_Node_Number> nodes;
  std::string ffdc_id;
};

/** The adapter group formed anew; `left` are those that are in it no longer. */
struct AdapterGroupEvent {
  MemberSet left;
};

/** The node group formed anew; `left` are those that are in it no longer. */
struct NodeGroupEvent {
  MemberSet left;
};

/** The configuration changed. */
struct ConfigurationEvent {};

/** One event with its number. */
struct Event {
  Hb_Seq_Num sequence = 0;
  std::variant<AdapterEvent, NodeEvent, AdapterGroupEvent, NodeGroupEvent, ConfigurationEvent, FailureData,
               DifferentInstance, HeartbeatSettings>
      body;
};

}  // namespace hbd

#endif
