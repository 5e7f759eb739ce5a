#include "support/event_target.h"

#include "hb_client.h"
#include "hb_communication/event_reception.h"
#include "support/conventions.h"
#include "support/query_check.h"
#include "support/subscription_check.h"
#include "support/system.h"
#include "utils.h"

namespace fuzz {

namespace {

constexpr int32_t start_up_kind = 0;
constexpr int32_t update_kind = 9;
constexpr size_t longest_sequence = 12;

}  // namespace

Event_Target::Event_Target(const Buffer& configuration, bool whole_checks)
    : configuration_(configuration), whole_checks_(whole_checks) {
  const Buffer frame = framed(start_up_kind, configuration);
  the_system.stream = frame;
  expect(no_error, hb_init);
  check_.model().load(configuration);
  check_.forget();
  packet_.reserve(1U << 16U);
  blocks_ = memchunks;
}

void Event_Target::run_packet(Input input, std::span<const int32_t> kinds) {
  const auto hostile = input.take<Hostile>();
  packet_.assign(input.rest().begin(), input.rest().end());
  set_kind(kinds);
  if ((hostile.flags & whole_node_list) != 0) {
    packet_.resize(std::max(packet_.size(), HB_REPLY_HEADER_SIZE + 4 * static_cast<size_t>(check_.limits().nodes)));
  }
  deliver(hostile);
  check_everything(hostile);
  check_.spoil(hostile);
  check_everything(hostile);
  use_subscriptions(hostile);
  restore();
}

void Event_Target::run_sequence(Input input) {
  auto hostile = input.take<Hostile>();
  for (size_t i = 0; i < longest_sequence && !input.empty(); ++i) {
    const Bytes bytes = input.take_bytes(input.take<uint16_t>() % 2048U);
    packet_.assign(bytes.begin(), bytes.end());
    deliver(hostile);
    check_everything(hostile);
    hostile.cursor =
        static_cast<Hb_Cursor>(static_cast<uint32_t>(hostile.cursor) + static_cast<uint32_t>(hostile.offset) % 16U);
  }
  use_subscriptions(hostile);
  restore();
}

// The packet keeps its kind when it is one of them; otherwise it gets the one that its first byte chooses.
void Event_Target::set_kind(std::span<const int32_t> kinds) {
  const int32_t kind = field<int32_t>(packet_, 0);
  if (packet_.empty() || std::find(kinds.begin(), kinds.end(), kind) != kinds.end()) {
    return;
  }
  const int32_t chosen = kinds[packet_[0] % kinds.size()];
  std::memcpy(packet_.data(), &chosen, std::min(packet_.size(), sizeof chosen));
}

void Event_Target::deliver(const Hostile& hostile) {
  if (field<int32_t>(packet_, 0) == update_kind && packet_.size() > HB_REPLY_HEADER_SIZE) {
    shrink_configuration(std::span(packet_).subspan(HB_REPLY_HEADER_SIZE));
  }
  const bool accepted = check_.take(packet_, (hostile.flags & wait_without_limit) != 0) == Hb_Success;
  configuration_changed_ = configuration_changed_ || (accepted && field<int32_t>(packet_, 0) == update_kind);
}

void Event_Target::check_everything(const Hostile& hostile) {
  check_group(check_.group(), check_.limits(), hostile, whole_checks_);
  if (whole_checks_) {
    check_queries(check_.model(), hostile);
  }
}

void Event_Target::use_subscriptions(const Hostile& hostile) {
  if (!whole_checks_) {
    return;
  }
  Subscription_Check subscription(check_.model(), hostile);
  for (unsigned operation = 0; operation < Subscription_Check::operations; ++operation) {
    subscription.perform(operation + hostile.site, hostile);
  }
  subscription.compare_all();
}

// Puts back what the input changed, so that every input starts from the same state.
void Event_Target::restore() {
  check_.forget();
  if (configuration_changed_) {
    static const Buffer update = framed(update_kind, configuration_);
    check_.take(Bytes(update).subspan(sizeof(int32_t)), true);
    check_.forget();
    configuration_changed_ = false;
  }
  client_hb_info = {};
  REQUIRE(memchunks == blocks_);
}

}  // namespace fuzz
