#include "played_daemon.h"

#include <stdexcept>

namespace hb_test {
namespace {

constexpr size_t kData = 76;  // of a request, after its header

Bytes text_at(const Bytes& bytes, size_t offset) { return bytes.c_str() + offset; }

}  // namespace

int32_t subscription_type(const Bytes& request) { return i32_at(request, kData); }
int32_t subscription_events(const Bytes& request) { return i32_at(request, kData + 8); }
std::string subscription_name(const Bytes& request) { return text_at(request, kData + 12); }
int32_t subscription_count(const Bytes& request) { return i32_at(request, kData + 48); }
Bytes subscription_members(const Bytes& request, size_t count) { return request.substr(kData + 52, count); }

void PlayedDaemon::start(const ConfigurationMessage& configuration) {
  connection_ = daemon_.accept();
  expect(201);
  connection_.send_frame(configuration_answer(configuration));
}

Bytes PlayedDaemon::expect(int32_t kind) {
  Bytes request = connection_.receive_request();
  if (i32_at(request, 8) != kind)
    throw std::runtime_error("request " + std::to_string(i32_at(request, 8)) + " came, not " + std::to_string(kind));
  return request;
}

Bytes PlayedDaemon::expect_subscription(const std::string& name) {
  Bytes request = expect(209);
  if (subscription_name(request) != name)
    throw std::runtime_error("subscription " + subscription_name(request) + " came, not " + name);
  return request;
}

void PlayedDaemon::expect_withdrawal(const std::string& name) {
  const Bytes request = expect(210);
  if (text_at(request, kData) != name)
    throw std::runtime_error("withdrawal of " + text_at(request, kData) + " came, not " + name);
}

void PlayedDaemon::send_nodes(int32_t kind, const std::string& name, uint32_t sequence,
                              const std::vector<uint32_t>& flags) {
  send(ReplyPacket(kind).name(name).sequence(sequence).message(node_event_message(flags)));
}

void PlayedDaemon::send_adapters(int32_t kind, const std::string& name, uint32_t sequence,
                                 const std::vector<AdapterEntry>& entries) {
  send(ReplyPacket(kind).name(name).sequence(sequence).message(adapter_event_message(entries)));
}

void PlayedDaemon::tell_who_is_up() {
  expect_subscription("hbctl.probe.nodes");
  expect_subscription("hbctl.probe.adapters");
  send_nodes(7, "hbctl.probe.nodes", 1, {1, 1, 0});
  send_adapters(4, "hbctl.probe.adapters", 1, {{0, 1}, {1, 1}, {2, 1}, {3, 1}});
  expect_withdrawal("hbctl.probe.nodes");
  expect_withdrawal("hbctl.probe.adapters");
}

}  // namespace hb_test
