// One record of an interface list.
#pragma once

#include <cstring>

#include "vex_platform_records.h"

// A missing name is empty.
inline const char* name_of(const zu_vex_net_intf_info_t& interface) {
  return interface.p_name != nullptr ? interface.p_name : "";
}

inline bool has_name(const zu_vex_net_intf_info_t& interface, const char* p_name) {
  return std::strncmp(name_of(interface), p_name, interface_name_length) == 0;
}
