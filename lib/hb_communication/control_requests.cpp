#include "hb_communication/control_requests.h"

#include <cstring>

#include "argument_check.h"
#include "configured_numbers.h"
#include "hb_client/configuration.h"
#include "hb_client/control.h"
#include "hb_client/lifecycle.h"
#include "hb_communication/connection.h"
#include "hb_communication/event_reception.h"

namespace {

// What a status of an answer means to the caller.
struct Status_Meaning {
  Hb_Request_Status status;
  int error;
};

constexpr Status_Meaning configure_meanings[] = {
    {HB_NO_SUCH_NETWORK, HB_ENONETWORK},    {HB_ADAPTER_ENABLED, HB_EWRONGSTATE},
    {HB_ADAPTER_NOT_CONFIG, HB_ENOADAPTER}, {HB_INVALID_SERVICE_ADDRESS, HB_EBADSERVICEADDR},
    {HB_SAME_ADDRESS, HB_ESAMEADDR},
};

// Of unconfiguring an adapter, and of swapping two.
constexpr Status_Meaning unconfigure_meanings[] = {
    {HB_NO_SUCH_NETWORK, HB_ENONETWORK},
    {HB_ADAPTER_ENABLED, HB_EWRONGSTATE},
    {HB_ADAPTER_NOT_CONFIG, HB_ENOADAPTER},
};

constexpr Status_Meaning grace_meanings[] = {
    {HB_NO_SUCH_NETWORK, HB_ENONETWORK},
    {HB_NOT_SUPPORTED, HB_ENOTSUPPORTED},
    {HB_GRACE_FAILED, HB_EGRACEFAILED},
    {HB_GRACE_TIME_OUT, HB_EGRACETIMEOUT},
};

constexpr Status_Meaning state_meanings[] = {
    {HB_NO_SUCH_NETWORK, HB_ENONETWORK},
    {HB_ADAPTER_NOT_CONFIG, HB_ENOADAPTER},
};

template <size_t N>
Hb_Rc result_of(int32_t status, const Status_Meaning (&meanings)[N]) {
  if (status == HB_REQUEST_SUCCESSFUL) {
    return Hb_Success;
  }
  for (const Status_Meaning& meaning : meanings) {
    if (meaning.status == status) {
      return fail(meaning.error);
    }
  }
  return fail(HB_EBADREPLY);
}

// The result that the daemon's answer tells.
template <size_t N>
Hb_Rc await_status(Hb_Client_Reply kind, const timeval* timeout, const Status_Meaning (&meanings)[N]) {
  Packet reply;
  return await_reply(kind, reply, timeout) == Hb_Success ? result_of(reply->value, meanings) : Hb_Failure;
}

bool is_local(Hb_Adapter_Number adapter) {
  const int64_t per_node = global_config_tbl.Hb_adapters_per_node;
  const int64_t first = per_node * global_config_tbl.local_node_number;
  return adapter >= first && adapter < first + per_node;
}

// The other adapter of a swap has to be one of this node, too.
Hb_Rc check_swap_partner(Hb_IP_address4 address) {
  Hb_IP_address6 mapped = {};
  mapped.i6_ipv6.s6_addr[10] = 0xFF;
  mapped.i6_ipv6.s6_addr[11] = 0xFF;
  mapped.v4_in_v6.v4_in_v6_ipv4 = address;
  Hb_Adapter_Number partner = HB_NO_ADAPTER;
  if (hb_get_adapter_number_by_address(mapped, &partner) != Hb_Success) {
    return Hb_Failure;
  }
  if (find_configured_adapter(partner) == nullptr) {
    return fail(HB_ENOADAPTER);
  }
  return is_local(partner) ? Hb_Success : fail(HB_EINVAL);
}

// One that needs nothing but a running client.
Hb_Rc send_request(Hb_Client_Request kind, void* data, int length) {
  return hb_init() == Hb_Success ? hb_send(kind, data, length) : Hb_Failure;
}

}  // namespace

Hb_Rc hb_config_local_adapter(Hb_Adapter_Number adapter_num, Hb_Client_Request msg_type, void* data) {
  if (hb_init() != Hb_Success) {
    return Hb_Failure;
  }
  const Hb_Adapter* adapter = configured_adapter(adapter_num);
  if (adapter == nullptr) {
    return Hb_Failure;
  }
  if (!is_local(adapter_num)) {
    return fail(HB_EINVAL);
  }
  hb_adapter_value request = {adapter->Hb_network, 0, 0};
  if (data == nullptr) {
    return hb_send(msg_type, &request, sizeof request.network);
  }
  std::memcpy(&request.value, data, sizeof request.value);
  return hb_send(msg_type, &request, sizeof request);
}

Hb_Rc hb_enable_adapter(Hb_Adapter_Number adapter) {
  return hb_config_local_adapter(adapter, HB_ENABLE_ADAPTER, nullptr);
}

Hb_Rc hb_disable_adapter(Hb_Adapter_Number adapter) {
  return hb_config_local_adapter(adapter, HB_DISABLE_ADAPTER, nullptr);
}

Hb_Rc hb_ifconfig_down(Hb_Adapter_Number adapter) {
  return hb_config_local_adapter(adapter, HB_IFCONFIG_DOWN, nullptr);
}

Hb_Rc hb_ifconfig_up(Hb_Adapter_Number adapter) { return hb_config_local_adapter(adapter, HB_IFCONFIG_UP, nullptr); }

Hb_Rc hb_configure_adapter(Hb_Adapter_Number adapter, Hb_IP_address4 address) {
  if (hb_config_local_adapter(adapter, HB_CONFIGURE_ADAPTER, &address) != Hb_Success) {
    return Hb_Failure;
  }
  return await_status(HB_CONFIG_ADAPTER, &reply_from_server_deftimeout, configure_meanings);
}

Hb_Rc hb_unconfigure_adapter(Hb_Adapter_Number adapter) {
  if (hb_config_local_adapter(adapter, HB_UNCONFIGURE_ADAPTER, nullptr) != Hb_Success) {
    return Hb_Failure;
  }
  return await_status(HB_CONFIG_ADAPTER, &reply_from_server_deftimeout, unconfigure_meanings);
}

Hb_Rc hb_swap_adapters(Hb_Adapter_Number adapter, Hb_IP_address4 address) {
  if (check_swap_partner(address) != Hb_Success ||
      hb_config_local_adapter(adapter, HB_SWAP_ADAPTERS, &address) != Hb_Success) {
    return Hb_Failure;
  }
  return await_status(HB_CONFIG_ADAPTER, &reply_from_server_deftimeout, unconfigure_meanings);
}

Hb_Rc hb_adapter_grace(Hb_Adapter_Number adapter, int seconds) {
  if (hb_config_local_adapter(adapter, HB_ADAPTER_GRACE_REQ, &seconds) != Hb_Success) {
    return Hb_Failure;
  }
  return await_status(HB_ADAPTER_GRACE, nullptr, grace_meanings);
}

Hb_Rc hb_get_adapter_state(Hb_Adapter_Number adapter, Hb_Adapter_state_t* state) {
  if (start_with(state) != Hb_Success ||
      hb_config_local_adapter(adapter, HB_GET_ADAPTER_STATE, nullptr) != Hb_Success) {
    return Hb_Failure;
  }
  Packet reply;
  if (await_reply(HB_ADAPTER_STATE, reply, &reply_from_server_deftimeout) != Hb_Success ||
      result_of(reply->value, state_meanings) != Hb_Success) {
    return Hb_Failure;
  }
  const Message message(reply);
  if (!message.holds(0, sizeof *state)) {
    return fail(HB_EBADREPLY);
  }
  *state = message.at<Hb_Adapter_state_t>(0);
  return Hb_Success;
}

Hb_Rc hb_notify_adapter_down(Hb_Adapter_Number adapter_num, Hb_Client_Request msg_type) {
  if (hb_init() != Hb_Success || configured_adapter(adapter_num) == nullptr) {
    return Hb_Failure;
  }
  return hb_send(msg_type, nullptr, static_cast<int>(adapter_num));
}

Hb_Rc hb_adapter_may_be_down(Hb_Adapter_Number adapter) {
  return hb_notify_adapter_down(adapter, HB_ADAPTER_MAY_BE_DOWN);
}

Hb_Rc hb_adapter_is_down(Hb_Adapter_Number adapter) { return hb_notify_adapter_down(adapter, HB_ADAPTER_IS_DOWN); }

Hb_Rc hb_notify_node_down(Hb_Node_Number node_num, Hb_Client_Request msg_type) {
  if (hb_init() != Hb_Success || check_configured_node(node_num) != Hb_Success) {
    return Hb_Failure;
  }
  return hb_send(msg_type, nullptr, node_num);
}

Hb_Rc hb_node_may_be_down(Hb_Node_Number node) { return hb_notify_node_down(node, HB_NODE_MAY_BE_DOWN); }

Hb_Rc hb_node_is_down(Hb_Node_Number node) { return hb_notify_node_down(node, HB_NODE_IS_DOWN); }

Hb_Rc hb_simulate_death(int slept_sec) { return send_request(HB_SIMULATE_DEATH, &slept_sec, sizeof slept_sec); }

Hb_Rc hb_discard_stale_messages(Hb_Boolean discard_flag) {
  return send_request(discard_flag == Hb_True ? HB_DISCARD_STALE_MESSAGES : HB_DONT_DISCARD_STALE_MESSAGES, nullptr, 0);
}

Hb_Rc hb_client_heartbeat(Hb_Seq_Num seqnum) { return send_request(HB_CLIENT_HEARTBEAT, &seqnum, sizeof seqnum); }

Hb_Rc hb_nim_manual_start_control(Hb_nim_manctrl ctrl, char* interface) {
  if (start_with(interface) != Hb_Success) {
    return Hb_Failure;
  }
  if (ctrl != HB_NIM_MANCTRL_ENABLE && ctrl != HB_NIM_MANCTRL_DISABLED) {
    return fail(HB_EINVAL);
  }
  // A name that is too long is cut one character behind the limit, where hb_send() refuses it.
  const auto length = static_cast<int>(strnlen(interface, HB_REQUEST_MESSAGE_SIZE + 1));
  return hb_send(ctrl == HB_NIM_MANCTRL_ENABLE ? HB_ENABLE_MANUAL_CONTROL_NIMS : HB_DISABLE_MANUAL_CONTROL_NIMS,
                 length > 0 ? interface : nullptr, length);
}

Hb_Rc hb_get_client_hb_info(Hb_client_hb_info_t* client_hb_info_p) {
  if (!all_given(client_hb_info_p)) {
    return fail(HB_EINVAL);
  }
  *client_hb_info_p = client_hb_info;
  return Hb_Success;
}

Hb_Rc hb_get_local_rem_sim_node_down_period(timeval* sim_rem_node_down_period, timeval* sim_local_node_down_period) {
  if (hb_init() != Hb_Success) {
    return Hb_Failure;
  }
  if (sim_rem_node_down_period != nullptr) {
    *sim_rem_node_down_period = global_config_tbl.Hb_rem_node_down_sim_period;
  }
  if (sim_local_node_down_period != nullptr) {
    *sim_local_node_down_period = global_config_tbl.Hb_local_node_down_sim_period;
  }
  return Hb_Success;
}
