// What differs between two configuration tables, told as events.
//
// Each fails when there is no memory for an event; the events that were made by then are still the caller's. Who
// replaces a table has to know that: a difference that is not told is none any more with the next table. An adapter or
// a node whose number an event has no place for is in no event, and is not counted.
#pragma once

#include "VEX_EVMONHandler.h"

// Where each kind of event goes; every event is made with the handler's constructors.
struct Comparison_Events {
  Hb_VEX_Event** adapter_death;
  Hb_VEX_Event** node_death;
  Hb_VEX_Event** config;
  Hb_VEX_Event** adapter_join;
  Hb_VEX_Event** node_join;
};

// From the table in force to the new one.
Hb_Rc tell_table_changes(EVMONHandler& handler, Hb_Configuration_Internal& new_table, const Comparison_Events& events);

// What is up in the first table, and in the second one gone or not up. One node may be left out, with its adapters.
Hb_Rc tell_lost_adapters(EVMONHandler& handler, const Hb_Configuration_Internal& table1,
                         const Hb_Configuration_Internal& table2, zu_int32_t kind, Hb_VEX_Event** event,
                         zu_int32_t left_out = VEX_no_node);
Hb_Rc tell_lost_nodes(EVMONHandler& handler, const Hb_Configuration_Internal& table1,
                      const Hb_Configuration_Internal& table2, zu_int32_t kind, Hb_VEX_Event** event,
                      zu_int32_t left_out = VEX_no_node);

// One event, however much of the configuration differs.
Hb_Rc tell_configuration_change(EVMONHandler& handler, Hb_Configuration_Internal& table1,
                                Hb_Configuration_Internal& table2, Hb_VEX_Event** event);
