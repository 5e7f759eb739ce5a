#include "duration.h"

#include <array>
#include <charconv>
#include <cmath>
#include <utility>

namespace hbd {
namespace {

constexpr std::array<std::pair<std::string_view, double>, 5> units = {
    {{"us", 1}, {"ms", 1e3}, {"s", 1e6}, {"m", 60e6}, {"h", 3600e6}}};
constexpr double a_year = 366.0 * 24 * 3600e6;

std::optional<double> microseconds_in(std::string_view unit) {
  for (const auto& [name, length] : units) {
    if (name == unit) {
      return length;
    }
  }
  return std::nullopt;
}

}  // namespace

std::optional<std::chrono::microseconds> parse_duration(std::string_view text) {
  double number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, std::chars_format::fixed);
  if (error != std::errc{}) {
    return std::nullopt;
  }
  const auto unit = microseconds_in(text.substr(static_cast<std::size_t>(end - text.data())));
  const double length = number * unit.value_or(-1);
  if (!unit || !(length >= 0 && length <= a_year)) {
    return std::nullopt;
  }
  return std::chrono::microseconds(std::llround(length));
}

}  // namespace hbd
