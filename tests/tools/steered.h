// A command that steers, and the daemon that it steers: one conversation, up to its end.
#pragma once

#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "hbctl_process.h"
#include "played_daemon.h"

namespace hb_test {

// A request as it goes over the connection, without the length of the frame: 76 bytes of header, and data.
inline Bytes request_packet(pid_t sender, int32_t kind, int32_t len, const Bytes& data) {
  return ByteBuilder().zeros(8).i32(kind).i32(len).zeros(48).i32(sender).zeros(8).raw(data).bytes();
}

inline Bytes octets(const std::vector<uint8_t>& values) { return {values.begin(), values.end()}; }

class Steered : public testing::Test {
 protected:
  // Runs the command up to its request, which is awaited in full; there is no other before it.
  Bytes begin(const std::vector<std::string>& arguments, int32_t kind, const Streams& streams = {}) {
    child_ = std::make_unique<ChildProcess>(hbctl(arguments), streams);
    daemon_.start();
    return daemon_.expect(kind);
  }

  // The same, and whether it is this request.
  void expect_request(const std::vector<std::string>& arguments, int32_t kind, const Bytes& data) {
    const Bytes request = begin(arguments, kind);
    EXPECT_EQ(request, request_packet(child_->pid(), kind, static_cast<int32_t>(data.size()), data))
        << testing::PrintToString(arguments);
  }

  void answer(const ReplyPacket& packet) { daemon_.send(packet); }

  // Nothing else is asked before the end.
  Finished end() {
    EXPECT_TRUE(daemon_.connection().at_end());
    return child_->finish();
  }

  // A command that fails after its start without a request.
  Finished run_without_request(const std::vector<std::string>& arguments,
                               const ConfigurationMessage& configuration = small_cluster()) {
    child_ = std::make_unique<ChildProcess>(hbctl(arguments));
    daemon_.start(configuration);
    return end();
  }

  static nlohmann::json parse(const Finished& finished) { return nlohmann::json::parse(finished.output); }

  PlayedDaemon& daemon() { return daemon_; }
  ChildProcess& child() { return *child_; }

 private:
  PlayedDaemon daemon_;
  std::unique_ptr<ChildProcess> child_;
};

}  // namespace hb_test
