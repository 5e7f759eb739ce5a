// A fixture whose client is started against a fake daemon.
#pragma once

#include <gtest/gtest.h>

#include <csignal>
#include <stdexcept>

#include "VEX_HBC_trace.h"
#include "hb_client/lifecycle.h"
#include "platform_doubles.h"
#include "support/fake_daemon.h"

namespace hb_test {

// Starts the client and returns the daemon's end of its connection. Throws when the start fails.
inline DaemonConnection start_client(FakeDaemon& daemon, const ConfigurationMessage& configuration) {
  daemon.serve_configuration(configuration_answer(configuration));
  if (hb_init() != Hb_Success) {
    throw std::runtime_error("the client did not start");
  }
  return daemon.take_connection();
}

// The platform as in a fresh process; the trace component registers again, with all categories at that level.
inline void reset_platform(uint8_t trace_level = 0) {
  platform_double().reset();
  platform_double().levels = {trace_level, trace_level, trace_level};
  hbc_trace_inited = 0;
}

class RunningClient : public testing::Test {
 protected:
  explicit RunningClient(const ConfigurationMessage& configuration = small_cluster(), uint8_t trace_level = 0)
      : RunningClient(Publication(), configuration, trace_level) {}

  RunningClient(const Publication& publication, const ConfigurationMessage& configuration, uint8_t trace_level = 0)
      : daemon(publication) {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform(trace_level);
    connection = start_client(daemon, configuration);
  }

  ~RunningClient() override { hb_terminate(); }

  FakeDaemon daemon;
  DaemonConnection connection;
};

}  // namespace hb_test
