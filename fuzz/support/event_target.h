// What the event targets share: a started client, one input with one or more packets, and everything a caller may do
// with what comes of them.
#pragma once

#include <span>

#include "support/event_check.h"

namespace fuzz {

class Event_Target {
 public:
  // Starts the client with that configuration. Whole checks look at every query and every member; without them a large
  // cluster can be run as often as it has to.
  Event_Target(const Buffer& configuration, bool whole_checks);

  // One packet of one of the kinds, whatever the input says of its kind.
  void run_packet(Input input, std::span<const int32_t> kinds);

  // Packets of any kind, one after the other.
  void run_sequence(Input input);

 private:
  void set_kind(std::span<const int32_t> kinds);
  void deliver(const Hostile& hostile);
  void check_everything(const Hostile& hostile);
  void use_subscriptions(const Hostile& hostile);
  void restore();

  Event_Check check_;
  Buffer configuration_;
  bool whole_checks_;
  Buffer packet_;
  bool configuration_changed_ = false;
  int blocks_ = 0;  // of the library's allocator, while the first configuration is loaded
};

}  // namespace fuzz
