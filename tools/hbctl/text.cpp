#include "text.h"

#include <fmt/format.h>

#include <algorithm>
#include <ctime>

namespace hbctl {
namespace {

bool is_control(char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7f; }

std::string format_time(const std::tm& parts, const char* format) {
  char text[32];
  return {text, std::strftime(text, sizeof text, format, &parts)};
}

int64_t milliseconds_within_second(WallClock::time_point time) {
  const auto since_epoch = std::chrono::duration_cast<std::chrono::milliseconds>(time.time_since_epoch());
  return since_epoch.count() % 1000;
}

}  // namespace

std::string printable(std::string_view text) {
  std::string result(text);
  std::replace_if(result.begin(), result.end(), is_control, '?');
  return result;
}

std::string number_ranges(std::vector<int64_t> numbers) {
  std::sort(numbers.begin(), numbers.end());
  std::string text;
  for (size_t first = 0; first < numbers.size();) {
    size_t last = first;
    while (last + 1 < numbers.size() && numbers[last + 1] <= numbers[last] + 1) ++last;
    if (!text.empty()) text += ", ";
    text += numbers[first] == numbers[last] ? fmt::format("{}", numbers[first])
                                            : fmt::format("{}-{}", numbers[first], numbers[last]);
    first = last + 1;
  }
  return text.empty() ? "none" : text;
}

std::string count_of(int64_t count, std::string_view thing) {
  return fmt::format("{} {}{}", count, thing, count == 1 ? "" : "s");
}

std::string time_of_day(WallClock::time_point time) {
  const std::time_t seconds = WallClock::to_time_t(time);
  std::tm parts{};
  localtime_r(&seconds, &parts);
  return fmt::format("{}.{:03}", format_time(parts, "%H:%M:%S"), milliseconds_within_second(time));
}

std::string utc_timestamp(WallClock::time_point time) {
  const std::time_t seconds = WallClock::to_time_t(time);
  std::tm parts{};
  gmtime_r(&seconds, &parts);
  return fmt::format("{}.{:03}Z", format_time(parts, "%Y-%m-%dT%H:%M:%S"), milliseconds_within_second(time));
}

}  // namespace hbctl
