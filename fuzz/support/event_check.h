// Taking events: what hb_get_event_message has to make of a packet, and whether it did.
#pragma once

#include <vector>

#include "hb_client/events.h"
#include "support/configuration_model.h"
#include "support/group_check.h"
#include "support/packets.h"

namespace fuzz {

class Event_Check {
 public:
  Event_Check();

  Configuration_Model& model() { return model_; }
  Hb_Group& group() { return actual_; }
  Group_Limits limits() const { return {model_.adapter_limit(), model_.header().max_nodes}; }

  // The packet is what the daemon sends next. Compares every output and every table that it can change.
  Hb_Rc take(Bytes packet, bool wait_without_limit);

  // Makes the record of the event as it was before the first one.
  void forget();

  // Overwrites the record's own fields, as a careless caller might.
  void spoil(const Hostile& hostile);

 private:
  struct Outputs {
    Hb_Events events;
    char name[HB_NAME_LENGTH];
    Hb_Seq_Num sequence;
  };

  int error_of(Bytes packet) const;
  void receive(Bytes packet, int error, bool wait_without_limit);
  void apply(Bytes packet);
  void apply_adapter_event(Bytes packet);
  void apply_node_event(Bytes packet);
  void apply_heartbeat(Bytes packet);
  void apply_configuration(Bytes packet);
  void expect_failure_data(Bytes packet);
  void set_event(Hb_Events events);
  void set_name(const char* name);
  void set_subscription_name(Bytes packet);
  void compare() const;
  void compare_tables();
  void touch(size_t size);

  Configuration_Model model_;
  Hb_Group actual_{};
  Hb_Group expected_{};
  Outputs actual_outputs_{};
  Outputs expected_outputs_{};
  size_t touched_ = 0;                  // bytes at the front of the record that an event may have changed
  std::vector<uint32_t> beyond_limit_;  // adapter numbers set behind them
  std::vector<Hb_Node_config_state> nodes_;
  std::vector<Hb_Adapter_Number> changed_adapters_;
};

}  // namespace fuzz
