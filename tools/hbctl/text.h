// Small pieces of text.
#pragma once

#include <chrono>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace hbctl {

// Text from outside, safe for a terminal: control characters become '?'.
std::string printable(std::string_view text);

// Ascending numbers with runs joined, as "0-3, 7"; "none" for an empty list.
std::string number_ranges(std::vector<int64_t> numbers);

// "1 node", "2 nodes".
std::string count_of(int64_t count, std::string_view thing);

using WallClock = std::chrono::system_clock;

// Local time of day, as "07:52:46.123".
std::string time_of_day(WallClock::time_point time);

// UTC, as "2026-11-21T07:52:46.123Z".
std::string utc_timestamp(WallClock::time_point time);

}  // namespace hbctl
