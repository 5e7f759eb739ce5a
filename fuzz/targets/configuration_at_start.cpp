// The answer that a starting client loads its configuration from, everything that asks about it, and stopping.
#include "hb_client.h"
#include "hb_communication/connection.h"
#include "hb_communication/shared_memory.h"
#include "support/conventions.h"
#include "support/packets.h"
#include "support/query_check.h"
#include "support/subscription_check.h"
#include "support/system.h"
#include "utils.h"

namespace {

using fuzz::the_system;

// The packet with its length in front.
fuzz::Bytes frame_of(fuzz::Bytes packet) {
  static fuzz::Buffer frame;
  const auto length = static_cast<int32_t>(packet.size());
  frame.assign(sizeof length, 0);
  std::memcpy(frame.data(), &length, sizeof length);
  frame.insert(frame.end(), packet.begin(), packet.end());
  return frame;
}

fuzz::Bytes shrunk(fuzz::Bytes packet) {
  static fuzz::Buffer copy;
  copy.assign(packet.begin(), packet.end());
  if (copy.size() > HB_REPLY_HEADER_SIZE) {
    fuzz::shrink_configuration(std::span(copy).subspan(HB_REPLY_HEADER_SIZE));
  }
  return copy;
}

void use(fuzz::Configuration_Model& model, const fuzz::Hostile& hostile) {
  fuzz::check_queries(model, hostile);
  fuzz::Subscription_Check subscription(model, hostile);
  for (unsigned operation = 0; operation < fuzz::Subscription_Check::operations; ++operation) {
    subscription.perform(operation + hostile.site, hostile);
  }
  subscription.compare_all();
}

// A start that failed leaves its connection and what it attached; here they go before the next one.
void clean_up() {
  REQUIRE(global_config_tbl.Hb_global_adapter_list == nullptr && global_config_tbl.adap_hash == nullptr);
  REQUIRE(global_config_tbl.node_list == nullptr && global_config_tbl.node_hash == nullptr);
  hb_remove_client_select();
  hb_remove_socket();
  hb_detach_shared_memory();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static fuzz::Configuration_Model model;
  fuzz::Input input(bytes, size);
  const auto hostile = input.take<fuzz::Hostile>();
  const fuzz::Bytes packet = shrunk(input.rest());
  const bool usable =
      fuzz::field<int32_t>(packet, 0) == 0 && fuzz::Configuration_Model::is_usable(fuzz::message_of(packet));
  const int blocks = memchunks;
  std::memset(static_cast<void*>(global_config_tbl.Hb_global_network_list), 0,
              sizeof global_config_tbl.Hb_global_network_list);
  model.clear_networks();
  the_system.stream = frame_of(packet);
  fuzz::expect(usable ? fuzz::no_error : int{HB_EBADREPLY}, hb_init);
  REQUIRE(the_system.stream.empty() && the_system.attached_segments == 3);
  if (usable) {
    model.load(fuzz::message_of(packet));
    use(model, hostile);
    fuzz::expect(fuzz::no_error, hb_terminate);
  } else {
    clean_up();
  }
  REQUIRE(the_system.open_connections == 0 && the_system.attached_segments == 0 && memchunks == blocks);
  return 0;
}
