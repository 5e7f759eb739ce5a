#include "support/steering_reply.h"

#include <arpa/inet.h>

#include <vector>

#include "hb_client.h"
#include "support/configuration_model.h"
#include "support/conventions.h"
#include "support/packets.h"
#include "support/system.h"

namespace fuzz {
namespace {

constexpr int local_node = 1;
constexpr size_t value_at = 56;
constexpr int32_t value_in_length = -1;

struct Arguments {
  uint32_t adapter;
  uint32_t address;
  int32_t seconds;
  int16_t node;
  uint8_t keep_adapter;  // odd: as it is; else an adapter of this node
  uint8_t keep_address;  // odd: as it is; else one of the configuration
};

struct Meaning {
  int32_t status;
  int error;
};

// How a request is sent and what its answers mean.
struct Operation {
  int32_t request;
  int32_t data_length;
  int32_t answer_kind;
  std::vector<Meaning> meanings;
};

const Operation& operation_of(Awaited which) {
  static const Operation operations[] = {
      {214,
       8,
       10,
       {{1, HB_ENONETWORK}, {3, HB_EWRONGSTATE}, {4, HB_ENOADAPTER}, {5, HB_EBADSERVICEADDR}, {6, HB_ESAMEADDR}}},
      {215, 2, 10, {{1, HB_ENONETWORK}, {3, HB_EWRONGSTATE}, {4, HB_ENOADAPTER}}},
      {218, 8, 10, {{1, HB_ENONETWORK}, {3, HB_EWRONGSTATE}, {4, HB_ENOADAPTER}}},
      {216, 8, 11, {{1, HB_ENONETWORK}, {7, HB_ENOTSUPPORTED}, {8, HB_EGRACEFAILED}, {9, HB_EGRACETIMEOUT}}},
      {223, 2, 14, {{1, HB_ENONETWORK}, {4, HB_ENOADAPTER}}},
      {211, value_in_length, 8, {}},
  };
  return operations[static_cast<size_t>(which)];
}

Configuration_Model start() {
  const Buffer message = small_configuration();
  const Buffer frame = framed(0, message);
  the_system.stream = frame;
  expect(no_error, hb_init);
  Configuration_Model model;
  model.load(message);
  return model;
}

// One request, and what has to come of it.
class Steering {
 public:
  Steering(Awaited which, Configuration_Model& model, Arguments arguments, Bytes answer)
      : which_(which), operation_(operation_of(which)), model_(model), arguments_(arguments), answer_(answer) {
    if (arguments_.keep_adapter % 2 == 0) {
      arguments_.adapter = model_.number_of(local_node, static_cast<int>(arguments_.adapter % 2));
    }
    if (arguments_.keep_address % 2 == 0) {
      const Hb_Adapter& adapter = model_.adapters()[arguments_.address % model_.adapters().size()];
      arguments_.address = adapter.Hb_ip_address.v4_in_v6.v4_in_v6_ipv4;
    }
  }

  void run() {
    the_system.sent = {};
    const int refusal = which_ == Awaited::route ? node_error() : request_error();
    expect(refusal != no_error ? refusal : answer_error(), [&] { return call(); });
    REQUIRE((the_system.sent.length > 0) == (refusal == no_error));
    if (refusal == no_error) {
      check_sent();
    }
    check_outputs(refusal == no_error && answer_error() == no_error);
  }

 private:
  Hb_Rc call() {
    switch (which_) {
      case Awaited::configure:
        return hb_configure_adapter(arguments_.adapter, arguments_.address);
      case Awaited::unconfigure:
        return hb_unconfigure_adapter(arguments_.adapter);
      case Awaited::swap:
        return hb_swap_adapters(arguments_.adapter, arguments_.address);
      case Awaited::grace:
        return hb_adapter_grace(arguments_.adapter, arguments_.seconds);
      case Awaited::state:
        return hb_get_adapter_state(arguments_.adapter, &state_);
      case Awaited::route:
        return hb_get_route(arguments_.node, &route_, &route_length_);
    }
    return Hb_Failure;
  }

  int request_error() const {
    const int partner = which_ == Awaited::swap ? partner_error() : no_error;
    return partner != no_error ? partner : adapter_error(arguments_.adapter);
  }

  int adapter_error(Hb_Adapter_Number adapter) const {
    if (adapter >= model_.adapter_limit()) {
      return HB_EINVAL;
    }
    if (!model_.has(adapter)) {
      return HB_ENOADAPTER;
    }
    return is_local(adapter) ? no_error : int{HB_EINVAL};
  }

  bool is_local(Hb_Adapter_Number adapter) const {
    const auto first = model_.number_of(local_node, 0);
    return adapter >= first && adapter < first + static_cast<uint32_t>(model_.header().adapters_per_node);
  }

  // The adapter that has the address is the first one of the configuration, and has to be one of this node.
  int partner_error() const {
    for (const Hb_Adapter& adapter : model_.adapters()) {
      if (adapter.Hb_ip_address.v4_in_v6.v4_in_v6_ipv4 == arguments_.address) {
        return is_local(adapter.Hb_adapter_num) ? no_error : int{HB_EINVAL};
      }
    }
    return HB_ENOADAPTER;
  }

  int node_error() const {
    if (!model_.is_node_number(arguments_.node)) {
      return HB_EINVAL;
    }
    return model_.is_present(arguments_.node) ? no_error : int{HB_ENONODE};
  }

  int answer_error() const {
    if (field<int32_t>(answer_, 0) != operation_.answer_kind) {
      return HB_EBADREPLY;
    }
    const auto value = field<int32_t>(answer_, value_at);
    if (which_ == Awaited::route) {
      return value == 0 ? int{HB_ENOROUTE} : completeness(sizeof route_);
    }
    if (value == 0) {
      return which_ == Awaited::state ? completeness(sizeof state_) : no_error;
    }
    for (const Meaning& meaning : operation_.meanings) {
      if (meaning.status == value) {
        return meaning.error;
      }
    }
    return HB_EBADREPLY;
  }

  int completeness(size_t size) const { return message_of(answer_).size() >= size ? no_error : int{HB_EBADREPLY}; }

  void check_sent() const {
    const Sent& sent = the_system.sent;
    const bool in_length = operation_.data_length == value_in_length;
    const int32_t length = in_length ? arguments_.node : operation_.data_length;
    REQUIRE(sent.length == 4 + 76 + static_cast<size_t>(length));
    REQUIRE(sent.at<int32_t>(4 + 8) == operation_.request);
    REQUIRE(sent.at<int32_t>(4 + 12) == length);
    if (!in_length) {
      REQUIRE(sent.at<int16_t>(4 + 76) == model_.find(arguments_.adapter)->Hb_network);
    }
    if (length == 8) {
      const auto value = which_ == Awaited::grace ? static_cast<uint32_t>(arguments_.seconds) : arguments_.address;
      REQUIRE(sent.at<int16_t>(4 + 78) == 0);
      REQUIRE(sent.at<uint32_t>(4 + 80) == value);
    }
  }

  void check_outputs(bool succeeded) const {
    const Bytes message = message_of(answer_);
    const bool has_state = succeeded && which_ == Awaited::state;
    const bool has_route = succeeded && which_ == Awaited::route;
    REQUIRE(static_cast<int32_t>(state_) == (has_state ? field<int32_t>(message, 0) : unset));
    REQUIRE(route_length_ == (has_route ? field<uint16_t>(answer_, value_at) : uint16_t{unset}));
    if (has_route) {
      REQUIRE(std::memcmp(&route_, message.data(), sizeof route_) == 0);
    } else {
      static constexpr Hb_Source_Route untouched = {};
      REQUIRE(std::memcmp(&route_, &untouched, sizeof route_) == 0);
    }
  }

  static constexpr int unset = 4711;

  Awaited which_;
  const Operation& operation_;
  Configuration_Model& model_;
  Arguments arguments_;
  Bytes answer_;
  Hb_Adapter_state_t state_ = static_cast<Hb_Adapter_state_t>(unset);
  Hb_Source_Route route_ = {};
  unsigned short route_length_ = unset;
};

}  // namespace

void run_steering_reply(Awaited operation, Input input) {
  static Configuration_Model model = start();
  static Buffer frame;
  const auto arguments = input.take<Arguments>();
  const Bytes answer = input.rest();
  const auto length = static_cast<int32_t>(answer.size());
  frame.assign(sizeof length, 0);
  std::memcpy(frame.data(), &length, sizeof length);
  frame.insert(frame.end(), answer.begin(), answer.end());
  the_system.stream = frame;
  Steering(operation, model, arguments, answer).run();
}

}  // namespace fuzz
