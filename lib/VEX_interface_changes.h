// What the monitor of interfaces and the monitor of their addresses have in common.
#pragma once

#include "VEX_EVMONConfigurationHandler.h"
#include "platform_membership.h"
#include "vex_outputs.h"
#include "vex_platform_records.h"

// Whether the node starts with that interface. Without an address the name alone counts.
bool is_boot_interface(uint32_t node, const char* name, zu_vex_IP_address6_t* address);

// The adapter is one of an interface of that name.
bool is_adapter_on(const Hb_Adapter& adapter, const char* name);

// Lists the interfaces anew and tells what the notification changes. Fails with HB_EVEXTBL_INTF, and writes nothing,
// when the interfaces cannot be listed.
Hb_Rc rebuild_and_tell(EVMONConfigurationHandler& handler, zu_evm_event_metadata_t metadata, const Vex_Outputs& out);

// Of an alias it is told that it came or went, and no more; the next table has it.
inline Hb_Rc deliver_alias(const Vex_Outputs& out) {
  *out.events = HB_EVENT_ALIAS;
  return Hb_Success;
}

// Calls use(adapter) for each address of the node's interface of that name.
template <typename Use>
void for_each_adapter_on(const Hb_Configuration_Internal& table, uint32_t node, const char* name, Use use) {
  for_each_adapter_of(table, node, [&](Hb_Adapter& adapter) {
    if (is_adapter_on(adapter, name)) {
      use(adapter);
    }
  });
}
