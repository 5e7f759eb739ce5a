// Every trace record that the library makes. The numbers are for people's tools and never change their meaning;
// their texts are in the trace library's catalogue.
#pragma once

#include <cstdint>

enum Trace_Record : uint32_t {
  trace_node_liveness = 10,  // data: event type, node, node id (8 bytes), sequence number (8 bytes), reason number
  trace_node_liveness_read_failed = 11,     // result of the read, errno, descriptor
  trace_peer_gs_read_failed = 13,           // data: result of the read, descriptor, errno
  trace_adapter_liveness = 14,              // data: interface name
  trace_adapter_liveness_read_failed = 15,  // result of the read, descriptor, errno

  trace_table_query_failed = 36,  // data: name of the call, "(Default)", its result, errno

  trace_adapter_compared_with_table = 44,  // no values
  trace_adapter_is_alias = 45,             // data: interface name
  trace_adapter_in_table = 49,             // no values

  trace_reconfig_read_failed = 52,  // data: result of the read, descriptor, errno

  trace_adapters_of_dead_node = 78,  // no values

  trace_no_node_death_event = 86,  // no values

  trace_ip_change_read_failed = 95,      // result of the read, descriptor, errno
  trace_adapter_not_in_table = 96,       // no values
  trace_node_missing_from_table = 97,    // node
  trace_migration_handlers_failed = 98,  // result, error number
  trace_migration_table_failed = 99,     // result

  trace_migration_local_node_differs = 100,  // local node in the current table, in the trial table
  trace_migration_node_missing = 101,        // result

  trace_socket_removed = 110,            // no values
  trace_selector_removed = 111,          // no values
  trace_node_list_read_failed = 116,     // data: result of the read, descriptor, errno
  trace_adapter_loaded = 118,            // adapter number, node number
  trace_adapter_address_repeated = 119,  // data: address text, adapter type, adapter number, state

  trace_queued_event = 154,  // no values: an event is waiting in the queue

  trace_node_death_is_stale = 168,  // data: as trace_node_liveness

  trace_dispatch_without_handler = 170,  // first descriptor of the list
  trace_node_return_is_stale = 174,      // data: as trace_node_liveness

  trace_adapter_went_down = 181,  // no values
  trace_adapter_came_up = 182,    // no values
  trace_adapter_repeated = 183,   // no values

  trace_dead_node_adapters_unsubscribed = 192,  // no values
  trace_repository_disk_read_failed = 198,      // data: result of the read, descriptor, errno

  trace_site_config_read_failed = 210,  // data: result of the read, descriptor, errno
  trace_site_config_begins = 219,       // descriptor

  trace_site_config_ends = 220,         // descriptor
  trace_adapter_liveness_begins = 221,  // descriptor
  trace_adapter_liveness_ends = 222,    // descriptor
  trace_ip_change_begins = 225,         // descriptor
  trace_ip_change_ends = 226,           // descriptor
  trace_node_list_begins = 229,         // descriptor

  trace_node_list_ends = 230,            // descriptor
  trace_node_liveness_begins = 231,      // descriptor
  trace_node_liveness_nothing = 236,     // no values
  trace_adapter_liveness_nothing = 238,  // no values

  trace_ip_change_nothing = 240,    // no values
  trace_site_config_nothing = 243,  // no values
  trace_no_event_pipe = 245,        // no values
  trace_no_adapter_handler = 246,   // no values

  trace_event_wait_begins = 250,   // no values
  trace_event_wait_ends = 251,     // no values
  trace_dispatch_begins = 252,     // no values
  trace_dispatch_ends = 253,       // no values
  trace_split_merge_begins = 254,  // descriptor
  trace_split_merge_ends = 255,    // descriptor
  trace_split_merge = 256,         // data: event type, subtype, node, nodes up here, nodes up there, sequence number (8
                                   // bytes), reason number, descriptor
  trace_split_merge_nothing = 257,       // no values
  trace_split_merge_read_failed = 258,   // result of the read, descriptor, errno
  trace_split_merge_unsubscribed = 259,  // no values

  trace_split_merge_no_memory = 262,  // data: errno, file (100 bytes), line
  trace_split_marks_nodes = 263,      // no values
  trace_split_node_not_up = 264,      // node, its state
  trace_split_node_unknown = 265,     // node
  trace_node_repeated = 267,          // event type, node, state in the table, reason in the table

  trace_vex_start = 272,               // no values
  trace_boot_addresses_failed = 273,   // result of the boot-address query
  trace_mark_alias_failed = 274,       // result
  trace_filter_failed = 275,           // result
  trace_start_failed = 276,            // no values
  trace_interface_query_failed = 277,  // result of the interface query

  trace_node_liveness_ends = 284,  // descriptor, result

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

  trace_node_list = 330,        // data: event type, node, sequence number (8 bytes), reason number, node name
  trace_peer_gs = 331,          // data: event type, process id, sequence number (8 bytes), reason number, process name
  trace_reconfig = 332,         // data: event type, node, sequence number (8 bytes), reason number
  trace_repository_disk = 333,  // data: event type, node, sequence number (8 bytes), reason number, disk name
  trace_site_config = 334,      // data: event type, node, site, sequence number (8 bytes), reason number, site name
  trace_ip_change = 335,        // data: event type, node, interface name, address text
};
