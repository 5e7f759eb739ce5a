// One event, taken out of the library's record.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "hb_client/group.h"
#include "text.h"

namespace hbctl {

struct Member {
  Hb_Adapter_Number number;
  Hb_Incarnation incarnation;
  bool removed;  // left because it was removed from the configuration
  bool operator==(const Member&) const = default;
};

struct GroupIdentity {
  Hb_Adapter_Number leader;
  Hb_Incarnation incarnation;
};

struct Sender {
  std::string address;
  Hb_Config_Instance instance;
};

// What the daemon expects of a client that sends heartbeats.
struct HeartbeatSettings {
  double threshold;  // seconds, the longest time between two of them
  bool watched;      // whether it looks for them
  int daemon_pid;
};

enum class Subject { None, Nodes, Adapters };

struct Event {
  WallClock::time_point time;
  Hb_Events bits = 0;
  std::string subscription;
  Hb_Seq_Num sequence = 0;
  Subject subject = Subject::None;  // whether `nodes` or `adapters` says who is concerned
  std::vector<Hb_Node_Number> nodes;
  std::vector<Member> adapters;
  std::optional<bool> stable;             // new groups
  std::optional<GroupIdentity> identity;  // new groups of adapters
  std::optional<std::string> failure_data;
  std::optional<Sender> sender;  // different instance
  std::optional<HeartbeatSettings> heartbeat;

  std::vector<Hb_Adapter_Number> adapter_numbers() const;
};

// Reads the accessors over `group` into `event`, whose `bits` are set.
void read_group(Hb_Group& group, Event& event);

}  // namespace hbctl
