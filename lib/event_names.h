// Names of events that belong to no subscription.
#pragma once

inline constexpr char empty_event_name[] = "<EMPTY EVENT>";
inline constexpr char configuration_event_name[] = "Hb_Config_Group";
inline constexpr char ffdc_event_name[] = "Hb_FFDC_Group";
