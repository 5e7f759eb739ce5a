#include "sampling.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <span>

namespace bench {
namespace {

using Clock = std::chrono::steady_clock;

double seconds_since(Clock::time_point start) { return std::chrono::duration<double>(Clock::now() - start).count(); }

double time_of_one(const Contender& contender) {
  if (contender.prepare) contender.prepare();
  const auto start = Clock::now();
  contender.run();
  return seconds_since(start) / static_cast<double>(contender.operations);
}

double median(std::span<const double> samples) { return quantile({samples.begin(), samples.end()}, 0.5); }

double ratio_of_medians(std::span<const double> ours, std::span<const double> floor) {
  return median(ours) / median(floor);
}

bool ratio_is_stable(std::span<const double> ours, std::span<const double> floor, double tolerance) {
  const size_t half = ours.size() / 2;
  if (half == 0) return false;
  const double whole = ratio_of_medians(ours, floor);
  const double first = ratio_of_medians(ours.first(half), floor.first(half));
  const double second = ratio_of_medians(ours.subspan(half), floor.subspan(half));
  return std::abs(first - whole) <= tolerance * whole && std::abs(second - whole) <= tolerance * whole;
}

Samples ratio_of_each_round(const Samples& ours, const Samples& floor) {
  Samples ratios(ours.size());
  std::transform(ours.begin(), ours.end(), floor.begin(), ratios.begin(), std::divides<>());
  return ratios;
}

}  // namespace

double quantile(Samples samples, double fraction) {
  const auto position = static_cast<ptrdiff_t>(std::lround(fraction * static_cast<double>(samples.size() - 1)));
  std::nth_element(samples.begin(), samples.begin() + position, samples.end());
  return samples[static_cast<size_t>(position)];
}

Comparison compare(const Samples& ours, const Samples& floor, const Limits& limits) {
  const Samples ratios = ratio_of_each_round(ours, floor);
  return {.ours = median(ours),
          .floor = median(floor),
          .ratio = ratio_of_medians(ours, floor),
          .ratio_low = quantile(ratios, 0.25),
          .ratio_high = quantile(ratios, 0.75),
          .rounds = ours.size(),
          .stable = ratio_is_stable(ours, floor, limits.tolerance)};
}

Comparison measure(const Contender& ours, const Contender& floor, const Limits& limits) {
  Samples our_samples;
  Samples floor_samples;
  time_of_one(ours);  // once each to warm up
  time_of_one(floor);
  const auto start = Clock::now();
  for (size_t next_look = limits.least_rounds;; next_look += next_look / 4 + 1) {
    while (our_samples.size() < next_look) {
      const bool ours_first = our_samples.size() % 2 == 0;
      if (ours_first) our_samples.push_back(time_of_one(ours));
      floor_samples.push_back(time_of_one(floor));
      if (!ours_first) our_samples.push_back(time_of_one(ours));
    }
    const Comparison result = compare(our_samples, floor_samples, limits);
    if (result.stable || seconds_since(start) > limits.most_seconds) return result;
  }
}

}  // namespace bench
