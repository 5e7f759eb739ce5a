// What a table that was rebuilt for the report of one node changes for the members of other nodes.
#pragma once

#include <utility>

#include "VEX_EVMONHandler.h"
#include "owned_event.h"

class Changes_Of_Others {
 public:
  // From the table in force to the rebuilt one, without a node of each kind. Fails when there is no memory for an
  // event.
  Hb_Rc find(EVMONHandler& handler, zu_int32_t no_death_of, zu_int32_t no_join_of);

  // The joins of adapters with no node left out, for when the cluster services do not tell who joins with a node.
  Hb_Rc find_adapter_joins(EVMONHandler& handler);

  bool has_deaths() const { return adapter_death_ != nullptr || node_death_ != nullptr; }

  // Deaths name numbers of the table in force, joins those of the rebuilt one: its event comes between them.
  void append_deaths();
  void append_joins();

 private:
  Owned_Event adapter_death_;
  Owned_Event node_death_;
  Owned_Event node_join_;
  Owned_Event adapter_join_;
};
