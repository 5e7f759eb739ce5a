// Owner of the new-group pipe, through which a subscription asks for the initial group.
//
// What the interface leaves open:
// - The answer is a new group (event 4) of all members, under the name of the subscription, with sequence number 0. A
//   group of nodes says how many they are, and so does a group of adapters, which has no leader and no incarnation.
// - Members are those that the cluster services report up and that the configuration in force knows; others join when
//   their configuration is delivered. A node that is down because its group-services daemon is stays down, as in a
//   table that is built anew. An interface whose state is stale has the state that is known of it.
// - Nothing of the configuration changes, so that a notification about a member is told of as if nobody had asked.
#pragma once

#include "VEX_EVMONHandler.h"

// What a subscription writes into the pipe.
inline constexpr char VEX_ask_for_node_group = 1;
inline constexpr char VEX_ask_for_adapter_group = 2;

class EVMONNewGroupEventHandler : public EVMONHandler {
 public:
  EVMONNewGroupEventHandler(int32_t* fds, char* path);  // fds: read end, write end; both are taken over
  explicit EVMONNewGroupEventHandler(char* path);       // a monitor file in the place of a pipe
  ~EVMONNewGroupEventHandler() override;

  // Answers one request with the present group. It waits for a request when the read end does.
  Hb_Rc handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) override;
  int32_t getWriteFd();

 protected:
  int32_t evmon_pipe_write_fd;
};
