#include "cluster.h"

#include <algorithm>

#include "address.h"
#include "errors.h"
#include "hb_client.h"
#include "text.h"

namespace hbctl {
namespace {

void require(Hb_Rc result, const char* what) {
  if (result != Hb_Success) throw library_error(what);
}

// Walks one of the library's first/next pairs to its end.
template <class Number, class First, class Next>
std::vector<Number> walk(First first, Next next, const char* what) {
  std::vector<Number> numbers;
  Number number{};
  Hb_Cursor cursor = 0;
  Hb_Rc result = first(&number, &cursor);
  for (; result == Hb_Success; result = next(&number, &cursor)) numbers.push_back(number);
  if (hb_get_errno() != HB_ENOMORE) throw library_error(what);
  return numbers;
}

std::vector<Hb_Adapter_Number> adapters_in_network(Hb_Network_Number network) {
  return walk<Hb_Adapter_Number>(
      [network](auto* number, auto* cursor) {
        return hb_get_first_configured_adapter_in_network(network, number, cursor);
      },
      [network](auto* number, auto* cursor) {
        return hb_get_next_configured_adapter_in_network(network, number, cursor);
      },
      "cannot list the adapters of a network");
}

Network read_network(Hb_Network_Number number) {
  Hb_Network_Name name{};
  Hb_Network_Type type{};
  require(hb_get_network_name_by_number(number, name), "cannot read the name of a network");
  require(hb_get_network_type_by_number(number, type), "cannot read the type of a network");
  return {number, printable(name), printable(type), adapters_in_network(number)};
}

Node read_node(Hb_Node_Number number) {
  int adapters = 0;
  require(hb_get_number_of_configured_adapters_in_node(number, &adapters), "cannot count the adapters of a node");
  return {number, adapters};
}

// The slots that every node has: the first offset that is out of range.
int slots_per_node(Hb_Node_Number node) {
  Hb_Adapter_Number number = HB_NO_ADAPTER;
  int offset = 0;
  while (offset < HB_MAX_ADAPTERS &&
         (hb_get_adapter_number_by_node_number(node, offset, &number) == Hb_Success || hb_get_errno() != HB_EINVAL))
    ++offset;
  return offset;
}

Adapter read_adapter(Hb_Adapter_Number number, int slots) {
  Adapter adapter{number, {}, {}, {}, "", ""};
  Hb_Node_Number node = HB_NO_NODE;
  if (hb_get_node_number_by_adapter_number(number, &node) == Hb_Success) {
    adapter.node = node;
    if (slots > 0) adapter.offset = static_cast<int>(number % static_cast<Hb_Adapter_Number>(slots));
  }
  Hb_Adapter_Type type{};
  if (hb_get_adapter_type_by_number(number, type) == Hb_Success) adapter.type = printable(type);
  Hb_IP_address6 address{};
  if (hb_get_adapter_address_by_number(number, &address) == Hb_Success) adapter.address = address_text(address);
  return adapter;
}

void assign_networks(Cluster& cluster) {
  std::unordered_map<Hb_Adapter_Number, Hb_Network_Number> network_of;
  for (const Network& network : cluster.networks)
    for (Hb_Adapter_Number adapter : network.adapters) network_of.emplace(adapter, network.number);
  for (Adapter& adapter : cluster.adapters) {
    const auto found = network_of.find(adapter.number);
    if (found != network_of.end()) adapter.network = found->second;
  }
}

void read_nodes(Cluster& cluster) {
  for (auto number : walk<Hb_Node_Number>(hb_get_first_configured_node_number, hb_get_next_configured_node_number,
                                          "cannot list the nodes"))
    cluster.nodes.push_back(read_node(number));
}

// Slots beyond the number of networks may keep a name of an earlier configuration.
void read_networks(Cluster& cluster) {
  int count = 0;
  require(hb_get_number_of_configured_networks(&count), "cannot count the networks");
  for (auto number : walk<Hb_Network_Number>(hb_get_first_configured_network_number,
                                             hb_get_next_configured_network_number, "cannot list the networks"))
    if (number < count) cluster.networks.push_back(read_network(number));
}

void read_adapters(Cluster& cluster) {
  const int slots = cluster.nodes.empty() ? 0 : slots_per_node(cluster.nodes.front().number);
  for (auto number : walk<Hb_Adapter_Number>(hb_get_first_configured_adapter_number,
                                             hb_get_next_configured_adapter_number, "cannot list the adapters"))
    cluster.adapters.push_back(read_adapter(number, slots));
  assign_networks(cluster);
}

}  // namespace

const Network* Cluster::network(std::optional<Hb_Network_Number> number) const {
  if (!number) return nullptr;
  const auto found =
      std::find_if(networks.begin(), networks.end(), [&](const Network& item) { return item.number == *number; });
  return found == networks.end() ? nullptr : &*found;
}

std::vector<Hb_Node_Number> Cluster::node_numbers() const {
  std::vector<Hb_Node_Number> numbers;
  for (const Node& node : nodes) numbers.push_back(node.number);
  return numbers;
}

std::vector<Hb_Adapter_Number> Cluster::adapter_numbers() const {
  std::vector<Hb_Adapter_Number> numbers;
  for (const Adapter& adapter : adapters) numbers.push_back(adapter.number);
  return numbers;
}

AdapterIndex::AdapterIndex(const Cluster& cluster) {
  for (const Adapter& adapter : cluster.adapters) adapters_.emplace(adapter.number, &adapter);
}

const Adapter* AdapterIndex::find(Hb_Adapter_Number number) const {
  const auto found = adapters_.find(number);
  return found == adapters_.end() ? nullptr : found->second;
}

Cluster read_cluster() {
  Cluster cluster;
  require(hb_get_my_node_number(&cluster.local_node), "cannot read the local node's number");
  read_nodes(cluster);
  read_networks(cluster);
  read_adapters(cluster);
  cluster.sites = walk<Hb_Site_Number>(hb_get_first_configured_site_number, hb_get_next_configured_site_number,
                                       "cannot list the sites");
  return cluster;
}

}  // namespace hbctl
