/* Statuses that a scenario gives in place of an effect. */
#ifndef HBD_SCRIPTED_ANSWERS_H
#define HBD_SCRIPTED_ANSWERS_H

#include <optional>
#include <string_view>
#include <vector>

#include "control_settings.h"

namespace hbd {

/** The answers that are left, in their order. */
class ScriptedAnswers {
 public:
  explicit ScriptedAnswers(std::vector<ScriptedAnswer> answers) : answers_(std::move(answers)) {}

  /** Takes the next answer to such a request, if there is one. */
  std::optional<ScriptedAnswer> take(Hb_Client_Request request);

 private:
  std::vector<ScriptedAnswer> answers_;
};

/** A name of scenarios and what it stands for. */
template <typename Value>
struct ScenarioName {
  std::string_view name;
  Value value;
};

/** Requests whose answers can be scripted. */
inline constexpr ScenarioName<Hb_Client_Request> scripted_requests[] = {
    {"configure-adapter", HB_CONFIGURE_ADAPTER}, {"unconfigure-adapter", HB_UNCONFIGURE_ADAPTER},
    {"swap-adapters", HB_SWAP_ADAPTERS},         {"adapter-grace", HB_ADAPTER_GRACE_REQ},
    {"adapter-state", HB_GET_ADAPTER_STATE},
};

/** Every status. */
inline constexpr ScenarioName<Hb_Request_Status> scripted_statuses[] = {
    {"successful", HB_REQUEST_SUCCESSFUL},
    {"no-such-network", HB_NO_SUCH_NETWORK},
    {"try-again", HB_TRY_AGAIN},
    {"adapter-enabled", HB_ADAPTER_ENABLED},
    {"adapter-not-configured", HB_ADAPTER_NOT_CONFIG},
    {"invalid-service-address", HB_INVALID_SERVICE_ADDRESS},
    {"same-address", HB_SAME_ADDRESS},
    {"not-supported", HB_NOT_SUPPORTED},
    {"grace-failed", HB_GRACE_FAILED},
    {"grace-timed-out", HB_GRACE_TIME_OUT},
};

/** Every state of an adapter. */
inline constexpr ScenarioName<Hb_Adapter_state_t> scripted_states[] = {
    {"unknown", Hb_Adapter_Unknown},
    {"up", Hb_Adapter_Up},
    {"down", Hb_Adapter_Down},
    {"interface-down", Hb_Adapter_ifconfig_Down},
    {"misconfigured", Hb_Adapter_Misconfig},
    {"broadcast-misconfigured", Hb_Adapter_Bcast_Misconfig},
    {"not-monitored", Hb_Adapter_Not_Monitored},
    {"no-monitor", Hb_Adapter_No_NIM},
    {"monitor-error", Hb_Adapter_netmon_error},
    {"cannot-bind-socket", Hb_Adapter_Cannot_bind_IP_soc},
    {"cannot-open-device", Hb_Adapter_Cannot_open_device},
};

}  // namespace hbd

#endif
