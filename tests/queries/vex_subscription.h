// Subscriptions in VEX mode, with a new-group handler on a real pipe.
#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <memory>

#include "VEX_EVMONNewGroupEventHandler.h"
#include "platform_doubles.h"
#include "subscription_record.h"

namespace hb_test {

class VexSubscription : public Subscription {
 protected:
  VexSubscription() {
    IsVEX = Hb_True;
    for (Hb_Name* slot : slots) set_name(*slot, "");
  }
  ~VexSubscription() override {
    remove_handler();
    IsVEX = Hb_False;
    trace_nothing();
  }

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

  Hb_Rc subscribe(int32_t type, int events = 1) {
    Hb_Subscription_Group group = group_of_type(type);
    set_count(group, 1);
    char name[] = "follower";
    return hb_subscribe(name, &group, events);
  }

  std::unique_ptr<EVMONNewGroupEventHandler> handler;
  Hb_Name* slots[4] = {&nodeEventSubscriptionName, &networkEventSubscriptionName, &siteEventSubscriptionName,
                       &splitMergeEventSubscriptionName};

 private:
  int read_end_ = -1;
};

}  // namespace hb_test
