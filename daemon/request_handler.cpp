#include "request_handler.h"

#include <spdlog/spdlog.h>

#include <algorithm>
#include <array>

#include "packet_writer.h"

namespace hbd {
namespace {

/* Requests whose sender waits for an answer, and the answer until they have an effect here. */
struct Answer {
  Hb_Client_Request request;
  Hb_Client_Reply kind;
  std::int32_t value;
};

constexpr std::int32_t no_route = 0;

constexpr std::array<Answer, 6> answers = {{
    {HB_GET_ROUTE, HB_ROUTE, no_route},
    {HB_CONFIGURE_ADAPTER, HB_CONFIG_ADAPTER, HB_NOT_SUPPORTED},
    {HB_UNCONFIGURE_ADAPTER, HB_CONFIG_ADAPTER, HB_NOT_SUPPORTED},
    {HB_SWAP_ADAPTERS, HB_CONFIG_ADAPTER, HB_NOT_SUPPORTED},
    {HB_ADAPTER_GRACE_REQ, HB_ADAPTER_GRACE, HB_NOT_SUPPORTED},
    {HB_GET_ADAPTER_STATE, HB_ADAPTER_STATE, HB_NOT_SUPPORTED},
}};

}  // namespace

void RequestHandler::handle(Client& client, const Request& request) {
  std::visit([&](const auto& one) { serve(client, one); }, request);
}

void RequestHandler::serve(Client& client, const PlainRequest& request) {
  if (request.code == HB_GET_CONFIG_INFO) {
    client.follows_configuration = true;
    client.send(configuration());
    return;
  }
  const auto answer =
      std::find_if(answers.begin(), answers.end(), [&](const Answer& each) { return each.request == request.code; });
  if (answer != answers.end()) {
    client.send(answer_frame(answer->kind, answer->value));
  }
  spdlog::debug("{}: request {} with {}", client.label(), static_cast<int>(request.code), request.number);
}

void RequestHandler::serve(Client& client, const SubscribeRequest& request) {
  const Subscription& subscription = request.subscription;
  spdlog::debug("{}: subscribes to events {:#x} of type {} as \"{}\"", client.label(), subscription.events,
                static_cast<int>(subscription.type), subscription.name.data());
  client.subscriptions.put(subscription);
  for (const Event& event : subscription.first_events(cluster_)) {
    client.send(event_frame(event, cluster_), subscription.name);
  }
}

void RequestHandler::serve(Client& client, const UnsubscribeRequest& request) {
  const bool known = client.subscriptions.remove(request.name);
  spdlog::debug("{}: unsubscribes \"{}\"{}", client.label(), request.name.data(), known ? "" : ", which it had not");
}

/* Those that are malformed never get here: their connection ends first. */
void RequestHandler::serve(Client& client, const MalformedRequest& /*request*/) { client.disconnect(); }

std::size_t RequestHandler::configuration_size() { return configuration()->size(); }

const SharedFrame& RequestHandler::configuration() {
  if (!configuration_ || configuration_stands_for_ != cluster_.sequence()) {
    configuration_ = configuration_frame(cluster_);
    configuration_stands_for_ = cluster_.sequence();
  }
  return configuration_;
}

}  // namespace hbd
