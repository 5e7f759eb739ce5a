// Network slots of the configuration table. Numbers that no slot exists for are unused ones.
#pragma once

#include <cstring>
#include <string_view>

#include "configuration_table.h"
#include "hb_global_data/state.h"

inline std::string_view network_name(const Hb_Configuration_Internal& table, int network) {
  if (network < 0 || network >= HB_MAX_NETWORKS) {
    return {};
  }
  const Hb_Network_Name& name = table.Hb_global_network_list[network].Hb_network_name;
  return {name, strnlen(name, sizeof name)};
}

inline bool is_used_network(const Hb_Configuration_Internal& table, int network) {
  return !network_name(table, network).empty();
}

// Fails with HB_EINVAL (out of range) or HB_ENONETWORK (unused slot).
inline Hb_Rc check_configured_network(const Hb_Configuration_Internal& table, int network) {
  if (!is_network_number(table, network)) {
    return fail(HB_EINVAL);
  }
  return is_used_network(table, network) ? Hb_Success : fail(HB_ENONETWORK);
}
