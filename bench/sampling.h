// Comparing two operations in one run: batches of both in turns, until the ratio of their medians stays put.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

namespace bench {

// One side of a comparison.
struct Contender {
  std::function<void()> prepare = {};  // before each batch, not timed; may be empty
  std::function<void()> run;           // one batch
  size_t operations = 1;               // how many operations a batch is
};

struct Limits {
  size_t least_rounds = 60;  // rounds before the ratio is looked at
  double most_seconds = 20;  // give up on stability after that, and say so
  double tolerance = 0.02;   // the ratio of each half of the rounds lies this near to the ratio of all
};

// Seconds an operation, one sample a round.
using Samples = std::vector<double>;

struct Comparison {
  double ours = 0;       // median
  double floor = 0;      // median
  double ratio = 0;      // of the medians
  double ratio_low = 0;  // quartiles of the ratio of each round
  double ratio_high = 0;
  size_t rounds = 0;
  bool stable = false;
};

double quantile(Samples samples, double fraction);

// Requires as many samples of one as of the other, at least one.
Comparison compare(const Samples& ours, const Samples& floor, const Limits& limits);

// Batches of both in turns, the one that goes first changing every round.
Comparison measure(const Contender& ours, const Contender& floor, const Limits& limits);

}  // namespace bench
