// A new-group handler on a real pipe, and subscriptions in VEX mode.
#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>

#include "VEX_EVMONNewGroupEventHandler.h"
#include "platform_doubles.h"
#include "subscription_record.h"

namespace hb_test {

class NewGroupHandler {
 protected:
  NewGroupHandler() = default;
  ~NewGroupHandler() { remove_handler(); }

  // A new-group handler that writes to `write_end`. It owns both descriptors.
  void make_handler(int read_end, int write_end) {
    int32_t descriptors[2] = {read_end, write_end};
    char label[] = "new group";
    handler = std::make_unique<EVMONNewGroupEventHandler>(descriptors, label);
    new_group_event_handler_p = handler.get();
  }

  void make_pipe_handler() {
    int ends[2];
    ASSERT_EQ(0, pipe2(ends, O_NONBLOCK));
    read_end_ = ends[0];
    make_handler(ends[0], ends[1]);
  }

  void remove_handler() {
    new_group_event_handler_p = nullptr;
    handler.reset();
  }

  // Every byte in the pipe.
  std::vector<uint8_t> bytes_written() const {
    uint8_t bytes[16];
    const ssize_t count = read(read_end_, bytes, sizeof bytes);
    return {bytes, bytes + std::max<ssize_t>(count, 0)};
  }

  std::unique_ptr<EVMONNewGroupEventHandler> handler;

 private:
  int read_end_ = -1;
};

class VexSubscription : public Subscription, protected NewGroupHandler {
 protected:
  VexSubscription() {
    IsVEX = Hb_True;
    for (Hb_Name* slot : slots) set_name(*slot, "");
  }
  ~VexSubscription() override {
    IsVEX = Hb_False;
    platform_double().errno_after_trace = 0;
    trace_nothing();
  }

  // Switches tracing on, each record of which leaves another errno.
  static void trace_and_spoil_errno() {
    trace_only(trace_info);
    platform_double().errno_after_trace = EPERM;
  }

  Hb_Rc subscribe(int32_t type, int events = 1) {
    Hb_Subscription_Group group = group_of_type(type);
    set_count(group, 1);
    char name[] = "follower";
    return hb_subscribe(name, &group, events);
  }

  Hb_Name* slots[4] = {&nodeEventSubscriptionName, &networkEventSubscriptionName, &siteEventSubscriptionName,
                       &splitMergeEventSubscriptionName};
};

}  // namespace hb_test
