/* What each request does. */
#ifndef HBD_REQUEST_HANDLER_H
#define HBD_REQUEST_HANDLER_H

#include <functional>
#include <utility>

#include "adapter_control.h"
#include "client.h"
#include "cluster.h"
#include "control_settings.h"
#include "deadlines.h"
#include "frame.h"
#include "reports.h"
#include "routes.h"
#include "scripted_answers.h"
#include "simulated_interfaces.h"

namespace hbd {

/** Gives requests their effect on the cluster, and answers them from it as it stands then. */
class RequestHandler {
 public:
  /**
   * @param sink takes the changes that requests make to the cluster.
   * @param interfaces where interfaces and addresses are changed; null: in the cluster alone.
   */
  RequestHandler(Loop& loop, const Cluster& cluster, ChangeSink& sink, InterfaceControl* interfaces, RouteTable& routes,
                 const ControlSettings& settings);

  /** Called when a client asks for a shutdown as soon as nobody is connected any more. */
  void on_delayed_shutdown(std::function<void()> callback) { delayed_shutdown_ = std::move(callback); }

  /** Serves one well-formed request. */
  void handle(Client& client, const Request& request);

  /** Bytes of the answer to a request for the configuration, length included. */
  [[nodiscard]] std::size_t configuration_size();

 private:
  using Serve = void (RequestHandler::*)(Client& client, const PlainRequest& request);
  struct Effect {
    Hb_Client_Request request;
    Serve serve;
  };
  static const Effect effects[];

  void serve(Client& client, const PlainRequest& request);
  void serve(Client& client, const SubscribeRequest& request);
  void serve(Client& client, const UnsubscribeRequest& request);
  void serve(Client& client, const MalformedRequest& request);

  void send_configuration(Client& client, const PlainRequest& request);
  void send_route(Client& client, const PlainRequest& request);
  void send_state(Client& client, const PlainRequest& request);
  void steer_adapter(Client& client, const PlainRequest& request);
  void take_report(Client& client, const PlainRequest& request);
  void simulate_death(Client& client, const PlainRequest& request);
  void discard_stale(Client& client, const PlainRequest& request);
  void route_message(Client& client, const PlainRequest& request);
  void take_heartbeat(Client& client, const PlainRequest& request);
  void switch_manual_control(Client& client, const PlainRequest& request);
  void shut_down_later(Client& client, const PlainRequest& request);
  const SharedFrame& configuration();

  const Cluster& cluster_;
  ChangeSink& sink_;
  RouteTable& routes_;
  PendingChanges changes_; /* they wait for the answer: an event before it would be taken for the answer, and be lost */
  SimulatedInterfaces simulated_;
  Deadlines deadlines_;
  AdapterControl adapters_;
  Reports reports_;
  ScriptedAnswers answers_;
  HeartbeatAnswer heartbeat_;
  std::function<void()> delayed_shutdown_ = [] {};
  SharedFrame configuration_;
  Hb_Seq_Num configuration_stands_for_ = 0; /* number of the last event that the frame knows of */
  std::uint64_t routed_messages_ = 0;
  std::uint64_t routed_bytes_ = 0;
};

}  // namespace hbd

#endif
