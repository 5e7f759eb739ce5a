#include "hb_communication/routes.h"

#include <arpa/inet.h>

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <limits>
#include <tuple>

#include "argument_check.h"
#include "configured_numbers.h"
#include "hb_client/route.h"
#include "hb_communication/connection.h"
#include "hb_communication/reader_hold.h"
#include "hb_protocol/routing.h"

int int_compare(const void* first, const void* second) {
  const int64_t difference = int64_t{*static_cast<const int*>(first)} - *static_cast<const int*>(second);
  return static_cast<int>(std::clamp<int64_t>(difference, std::numeric_limits<int>::min(),  //
                                              std::numeric_limits<int>::max()));
}

namespace {

// The header may say another number since the segment was attached. It answers for routes that a program has put in the
// segment's place.
uint32_t published_routes() {
  return shared_route_info == attached_routes ? attached_route_count : data_for_client->number_of_nodes;
}

// Copies what is published for the node, which is current only while its number is that of the configuration.
bool copy_published_route(Hb_Node_Number node, route_sequence& route) {
  if (data_for_client == nullptr || shared_route_info == nullptr) {
    return false;
  }
  const Reader_Hold hold;
  if (static_cast<uint32_t>(node) >= published_routes()) {
    return false;
  }
  std::memcpy(&route, &shared_route_info[node], sizeof route);
  const Hb_Sequence_Number current = data_for_client->sequence_number;
  return current != 0 && route.sequence_number == current;
}

Hb_Rc read_published_route(Hb_Node_Number node, Hb_Source_Route* option, unsigned short* length, bool ip_only) {
  if (start_with(option, length) != Hb_Success) {
    return Hb_Failure;
  }
  if (!is_node_number(global_config_tbl, node)) {
    return fail(HB_EINVAL);
  }
  route_sequence route;
  if (!copy_published_route(node, route)) {
    return fail(HB_ENOROUTE);
  }
  if (ip_only && route.nonip != 0) {
    return fail(HB_ENOIPROUTE);
  }
  *length = route.length;
  *option = route.ip_option;
  return Hb_Success;
}

// The body of a routed message, as far as it is used: header, destinations, size and bytes lie end to end.
class Routing_Request {
 public:
  Routing_Request(int port_number, const int* nodes, int num_nodes) {
    daemon_routing_front front = {};
    front.port_number = ntohs(static_cast<uint16_t>(port_number));
    front.ttl = HB_ROUTING_TTL;
    front.daemon_routing_version = HB_ROUTING_VERSION;
    front.num_nodes = num_nodes;
    append(&front, sizeof front);
    append(nodes, static_cast<size_t>(num_nodes) * sizeof *nodes);
  }

  void append(const void* bytes, size_t size) {
    std::memcpy(bytes_ + size_, bytes, size);
    size_ += size;
  }

  Hb_Rc send() { return hb_send(HB_DAEMON_ROUTING_REQUEST, bytes_, static_cast<int>(size_)); }

 private:
  char bytes_[HB_ROUTED_MESSAGE_SIZE];
  size_t size_ = 0;
};

bool has_equal_neighbours(const int* nodes, int count) {
  return std::adjacent_find(nodes, nodes + count) != nodes + count;
}

// Two nodes may stand in either order; more are put in order where the caller has them.
Hb_Rc check_destinations(int* nodes, int num_nodes) {
  if (num_nodes > 2) {
    std::sort(nodes, nodes + num_nodes, [](int first, int second) { return int_compare(&first, &second) < 0; });
  }
  return has_equal_neighbours(nodes, num_nodes) ? fail(HB_EINVAL) : Hb_Success;
}

// The destinations in the order in which they are sent; two stay as they are where the caller has them.
const int* ascending(const int* nodes, int num_nodes, int (&pair)[2]) {
  if (num_nodes != 2) {
    return nodes;
  }
  std::tie(pair[0], pair[1]) = std::minmax(nodes[0], nodes[1]);
  return pair;
}

// Adds up the buffers. A sum beyond the limit may stop anywhere beyond it.
Hb_Rc check_buffers(const struct iovec* buffers, int count, size_t& sum) {
  const auto end = buffers + count;
  if (std::any_of(buffers, end,
                  [](const struct iovec& buffer) { return buffer.iov_base == nullptr || buffer.iov_len == 0; })) {
    return fail(HB_EINVAL);
  }
  sum = 0;
  for (auto buffer = buffers; buffer != end; ++buffer) {
    if (buffer->iov_len > HB_ROUTED_MESSAGE_SIZE - sum) {
      return fail(HB_EMSGTOOBIG);
    }
    sum += buffer->iov_len;
  }
  return Hb_Success;
}

}  // namespace

Hb_Rc hb_get_route(Hb_Node_Number node, Hb_Source_Route* option, unsigned short* length) {
  if (start_with(option, length) != Hb_Success || check_configured_node(node) != Hb_Success ||
      hb_send(HB_GET_ROUTE, nullptr, node) != Hb_Success) {
    return Hb_Failure;
  }
  Packet reply;
  if (await_reply(HB_ROUTE, reply, nullptr) != Hb_Success) {
    return Hb_Failure;
  }
  if (reply->value == 0) {
    return fail(HB_ENOROUTE);
  }
  const Message message(reply);
  if (!message.holds(0, sizeof *option)) {
    return fail(HB_EBADREPLY);
  }
  *length = static_cast<unsigned short>(reply->value);
  message.copy(option, 0, sizeof *option);
  return Hb_Success;
}

Hb_Rc hb_read_route(Hb_Node_Number node, Hb_Source_Route* option, unsigned short* length) {
  return read_published_route(node, option, length, false);
}

Hb_Rc hb_read_ip_route(Hb_Node_Number node, Hb_Source_Route* option, unsigned short* length) {
  return read_published_route(node, option, length, true);
}

Hb_Rc hb_daemon_route_mcast(struct iovec* iovec, int iov_cnt, int port_number, int* nodes, int num_nodes) {
  if (start_with(iovec, nodes) != Hb_Success) {
    return Hb_Failure;
  }
  if (iov_cnt < 0 || iov_cnt > HB_ROUTED_BUFFERS || num_nodes < 1 || num_nodes > HB_MAX_NODES) {
    return fail(HB_EINVAL);
  }
  size_t size = 0;
  if (check_destinations(nodes, num_nodes) != Hb_Success || check_buffers(iovec, iov_cnt, size) != Hb_Success) {
    return Hb_Failure;
  }
  const auto size_field = static_cast<int32_t>(size);
  if (sizeof(daemon_routing_front) + static_cast<size_t>(num_nodes) * sizeof *nodes + sizeof size_field + size >
      HB_ROUTED_MESSAGE_SIZE) {
    return fail(HB_EMSGTOOBIG);
  }
  int pair[2];
  Routing_Request request(port_number, ascending(nodes, num_nodes, pair), num_nodes);
  request.append(&size_field, sizeof size_field);
  std::for_each_n(iovec, iov_cnt,
                  [&request](const struct iovec& buffer) { request.append(buffer.iov_base, buffer.iov_len); });
  return request.send();
}
