// The library's error numbers, for people.
#pragma once

#include <string>

namespace hbctl {

// The number's name, as "HB_ECONNECT"; "unknown error" for one that has none.
std::string error_name(int number);

// Name, number and meaning, as "HB_ECONNECT (15), the daemon's socket could not be connected to".
std::string describe_error(int number);

}  // namespace hbctl
