// What a table that was rebuilt for the report of one node changes for the members of other nodes.
#pragma once

#include <memory>
#include <utility>

#include "VEX_EVMONHandler.h"

using Event = std::unique_ptr<Hb_VEX_Event>;

inline void append_event(Event event) {
  if (event != nullptr) {
    VEX_add_event_at_end(event.release());
  }
}

class Changes_Of_Others {
 public:
  // From the table in force to the rebuilt one, without a node of each kind. Fails when there is no memory for an
  // event.
  Hb_Rc find(EVMONHandler& handler, zu_int32_t no_death_of, zu_int32_t no_join_of);

  bool has_deaths() const { return adapter_death_ != nullptr || node_death_ != nullptr; }

  // Deaths name numbers of the table in force, joins those of the rebuilt one: its event comes between them.
  void append_deaths();
  void append_joins();

 private:
  Event adapter_death_;
  Event node_death_;
  Event node_join_;
  Event adapter_join_;
};
