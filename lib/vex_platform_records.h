// What the platform hands out, given back with its owner.
#pragma once

#include <memory>

#include "VEX_HBC_trace.h"
#include "zu_evm.h"

struct Monitor_Record_Release {
  void operator()(void* record) const {
    const Errno_Kept kept;
    zu_evm_free(record);
  }
};

// A record of a monitor, or a list of them.
template <typename Record>
using Monitor_Record = std::unique_ptr<Record, Monitor_Record_Release>;

struct Interface_List_Release {
  void operator()(zu_vex_net_intf_info_t* list) const {
    const Errno_Kept kept;
    zu_vex_free_net_intf_info(list);
  }
};

using Interface_List = std::unique_ptr<zu_vex_net_intf_info_t, Interface_List_Release>;

// Of an interface's name the first characters count; it may come without a terminator behind them.
enum { interface_name_length = 32 };

inline Trace_Block block_of_name(const char* name, size_t longest) {
  if (name == nullptr) {
    return {"", 1};
  }
  const size_t length = strnlen(name, longest);
  return {name, static_cast<uint32_t>(length < longest ? length + 1 : length)};
}

inline Trace_Block block_of_interface(const char* name) { return block_of_name(name, interface_name_length); }
