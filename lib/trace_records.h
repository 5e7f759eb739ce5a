// Every trace record that the library makes. The numbers are for people's tools and never change their meaning;
// their texts are in the trace library's catalogue.
#pragma once

#include <cstdint>

enum Trace_Record : uint32_t {
  trace_table_query_failed = 36,  // data: name of the call, "(Default)", its result, errno

  trace_socket_removed = 110,    // no values
  trace_selector_removed = 111,  // no values

  trace_adapter_loaded = 118,            // adapter number, node number
  trace_adapter_address_repeated = 119,  // data: address text, adapter type, adapter number, state

  trace_queued_event = 154,              // no values: an event is waiting in the queue
  trace_dispatch_without_handler = 170,  // first descriptor of the list
  trace_no_event_pipe = 245,             // no values
  trace_event_wait_begins = 250,         // no values
  trace_event_wait_ends = 251,           // no values
  trace_dispatch_begins = 252,           // no values
  trace_dispatch_ends = 253,             // no values

  trace_vex_start = 272,               // no values
  trace_boot_addresses_failed = 273,   // result of the boot-address query
  trace_mark_alias_failed = 274,       // result
  trace_filter_failed = 275,           // result
  trace_start_failed = 276,            // no values
  trace_interface_query_failed = 277,  // result of the interface query

  trace_node_of_adapter = 301,     // adapter number, node number
  trace_address_of_adapter = 302,  // data: address text, adapter number
  trace_type_of_adapter = 303,     // data: adapter type, adapter number

  trace_group_walk = 310,             // group type, cursor
  trace_group_walk_wrong_type = 311,  // group type, error number
  trace_group_walk_search = 312,      // 1 if a member was found, else 0; position
  trace_group_walk_end = 313,         // cursor
  trace_group_walk_cursor = 314,      // cursor after the member
  trace_node_unknown = 315,           // node number

  trace_no_new_group_handler = 320,    // no values
  trace_new_group_write_failed = 321,  // result of the write, errno
  trace_new_group_written = 322,       // descriptor
};
