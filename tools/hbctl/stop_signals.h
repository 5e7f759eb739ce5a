// SIGINT and SIGTERM as something to poll for.
#pragma once

namespace hbctl {

// From construction on, the first SIGINT and the first SIGTERM make the descriptor readable. A second one kills as
// ever, so that a command that is stuck can be ended.
class StopSignals {
 public:
  StopSignals();
  ~StopSignals();
  StopSignals(const StopSignals&) = delete;
  StopSignals& operator=(const StopSignals&) = delete;
  int descriptor() const { return pipe_[0]; }

 private:
  int pipe_[2];
};

}  // namespace hbctl
