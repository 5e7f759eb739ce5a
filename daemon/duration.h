/* Lengths of time as text. */
#ifndef HBD_DURATION_H
#define HBD_DURATION_H

#include <chrono>
#include <optional>
#include <string_view>

namespace hbd {

/** Reads a decimal number with a unit: "250ms", "1.5s", "2m", "1h". Nothing when it is not one, or beyond a year. */
std::optional<std::chrono::microseconds> parse_duration(std::string_view text);

}  // namespace hbd

#endif
