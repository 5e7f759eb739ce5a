#include "support/query_check.h"

#include <string>

#include "hb_client.h"
#include "support/walk_check.h"

namespace fuzz {

namespace {

template <typename Number>
void check_number(Hb_Rc (*query)(Number*), Number expected) {
  Number number{};
  expect(no_error, [&] { return query(&number); });
  REQUIRE(number == expected);
}

void check_counts(const Configuration_Model& model) {
  check_number(hb_get_number_of_configured_nodes, model.present_nodes());
  check_number(hb_get_number_of_configured_adapters, model.header().num_adapters);
  check_number(hb_get_number_of_configured_networks, model.header().num_networks);
  check_number(hb_get_number_of_configured_sites, 0);
  check_number(hb_get_my_node_number, static_cast<Hb_Node_Number>(model.header().local_node_number));
}

int error_of_node(const Configuration_Model& model, Hb_Node_Number node) {
  if (!model.is_node_number(node)) {
    return HB_EINVAL;
  }
  return model.is_present(node) ? no_error : int{HB_ENONODE};
}

int error_of_adapter(Configuration_Model& model, Hb_Adapter_Number adapter) {
  if (adapter >= model.adapter_limit()) {
    return HB_EINVAL;
  }
  return model.has(adapter) ? no_error : int{HB_ENOADAPTER};
}

int error_of_network(const Configuration_Model& model, Hb_Network_Number network) {
  if (!model.is_network_number(network)) {
    return HB_EINVAL;
  }
  return model.is_used_network(network) ? no_error : int{HB_ENONETWORK};
}

// The text of a field, which may have no terminator; a look-up hands out what leaves room for one.
template <size_t N>
std::string_view text_of(const char (&field)[N]) {
  return {field, strnlen(field, N - 1)};
}

void check_slot(Configuration_Model& model, const Hostile& hostile) {
  constexpr Hb_Adapter_Number unwritten = 4711;
  const bool in_range =
      model.is_node_number(hostile.node) && hostile.offset >= 0 && hostile.offset < model.header().adapters_per_node;
  const Hb_Adapter_Number number = in_range ? model.number_of(hostile.node, hostile.offset) : 0;
  const int error = !in_range ? HB_EINVAL : model.has(number) ? no_error : int{HB_ENOADAPTER};
  Hb_Adapter_Number found = unwritten;
  expect(error, [&] { return hb_get_adapter_number_by_node_number(hostile.node, hostile.offset, &found); });
  REQUIRE(found == (error == no_error ? number : unwritten));
}

void check_adapter(Configuration_Model& model, Hb_Adapter_Number adapter) {
  const int error = error_of_adapter(model, adapter);
  const Hb_Adapter* record = model.find(adapter);
  Hb_Node_Number node = HB_NO_NODE;
  expect(error, [&] { return hb_get_node_number_by_adapter_number(adapter, &node); });
  Hb_IP_address6 address{};
  expect(error, [&] { return hb_get_adapter_address_by_number(adapter, &address); });
  char type[HB_ADAPTER_TYPE_LENGTH] = "?";
  expect(error, [&] { return hb_get_adapter_type_by_number(adapter, type); });
  if (error == no_error) {
    REQUIRE(node == static_cast<int>(adapter / static_cast<uint32_t>(model.header().adapters_per_node)));
    REQUIRE(std::memcmp(&address, &record->Hb_ip_address, sizeof address) == 0);
    REQUIRE(type == text_of(record->Hb_adapter_type));
  } else {
    REQUIRE(node == HB_NO_NODE && std::strcmp(type, "?") == 0);
  }
}

Hb_IP_address6 address_to_find(const Configuration_Model& model, const Hostile& hostile) {
  if ((hostile.flags & address_of_an_adapter) != 0 && !model.adapters().empty()) {
    return model.adapters()[static_cast<uint32_t>(hostile.offset) % model.adapters().size()].Hb_ip_address;
  }
  Hb_IP_address6 address;
  std::memcpy(&address, hostile.address, sizeof address);
  return address;
}

void check_address(const Configuration_Model& model, const Hostile& hostile) {
  const Hb_IP_address6 address = address_to_find(model, hostile);
  const auto found =
      std::find_if(model.adapters().begin(), model.adapters().end(), [&address](const Hb_Adapter& adapter) {
        return std::memcmp(&adapter.Hb_ip_address, &address, sizeof address) == 0;
      });
  const bool known = found != model.adapters().end();
  Hb_Adapter_Number number = 0;
  expect(known ? no_error : int{HB_ENOADAPTER}, [&] { return hb_get_adapter_number_by_address(address, &number); });
  REQUIRE(number == (known ? found->Hb_adapter_num : HB_NO_ADAPTER));
}

std::string_view stored_name(const Configuration_Model& model, int network) {
  const Hb_Network_Name& name = model.network(network).Hb_network_name;
  return {name, strnlen(name, sizeof name)};
}

void check_network_name(const Configuration_Model& model, const Hostile& hostile) {
  char name[HB_NETWORK_NAME_LENGTH + 1] = {};
  if ((hostile.flags & name_of_a_network) != 0) {
    std::memcpy(
        name, model.network(static_cast<int>(static_cast<uint32_t>(hostile.offset) % HB_MAX_NETWORKS)).Hb_network_name,
        HB_NETWORK_NAME_LENGTH);
  } else {
    std::memcpy(name, hostile.address, sizeof hostile.address);
  }
  int expected = HB_NO_NETWORK;
  for (int network = 0; network < std::min<int>(model.header().adapters_per_node, HB_MAX_NETWORKS); ++network) {
    if (model.is_used_network(network) && stored_name(model, network) == name) {
      expected = network;
      break;
    }
  }
  Hb_Network_Number number = 0;
  expect(expected != HB_NO_NETWORK ? no_error : int{HB_ENONETWORK},
         [&] { return hb_get_network_number_by_name(name, &number); });
  REQUIRE(number == expected);
}

void check_network(const Configuration_Model& model, Hb_Network_Number network) {
  const int error = error_of_network(model, network);
  char name[HB_NETWORK_NAME_LENGTH] = "?";
  expect(error, [&] { return hb_get_network_name_by_number(network, name); });
  REQUIRE(name == (error == no_error ? text_of(model.network(network).Hb_network_name) : "?"));
  char type[HB_NETWORK_TYPE_LENGTH] = "?";
  expect(error == HB_EINVAL ? error : no_error, [&] { return hb_get_network_type_by_number(network, type); });
  if (error != HB_EINVAL) {
    REQUIRE(type == (network < HB_MAX_NETWORKS ? text_of(model.network(network).Hb_network_type) : ""));
  }
}

void walk_nodes(const Configuration_Model& model, Hb_Cursor hostile) {
  static Expected<Hb_Node_Number> expected;
  expected.clear();
  for (int node = 0; node < model.header().max_nodes; ++node) {
    if (model.is_present(node)) {
      expected.add(node, static_cast<Hb_Node_Number>(node));
    }
  }
  Hb_Node_Number node = 0;
  Hb_Cursor cursor = 0;
  check_walk(
      expected, HB_NO_NODE, node, cursor, hostile, [&] { return hb_get_first_configured_node_number(&node, &cursor); },
      [&] { return hb_get_next_configured_node_number(&node, &cursor); });
}

void walk_adapters(const Configuration_Model& model, Hb_Cursor hostile) {
  static Expected<Hb_Adapter_Number> expected;
  expected.clear();
  int position = 0;
  for (const Hb_Adapter& adapter : model.adapters()) {
    expected.add(position++, adapter.Hb_adapter_num);
  }
  Hb_Adapter_Number adapter = 0;
  Hb_Cursor cursor = 0;
  check_walk(
      expected, HB_NO_ADAPTER, adapter, cursor, hostile,
      [&] { return hb_get_first_configured_adapter_number(&adapter, &cursor); },
      [&] { return hb_get_next_configured_adapter_number(&adapter, &cursor); });
}

void walk_adapters_of_node(Configuration_Model& model, Hb_Node_Number node, Hb_Cursor hostile) {
  static Expected<Hb_Adapter_Number> expected;
  const int error = error_of_node(model, node);
  Hb_Adapter_Number adapter = 4711;
  Hb_Cursor cursor = hostile;
  int count = 0;
  expected.clear();
  for (int offset = 0; error == no_error && offset < model.header().adapters_per_node; ++offset) {
    if (model.has(model.number_of(node, offset))) {
      expected.add(offset, model.number_of(node, offset));
    }
  }
  expect(error, [&] { return hb_get_number_of_configured_adapters_in_node(node, &count); });
  REQUIRE(count == static_cast<int>(expected.members().size()));
  const auto first = [&] { return hb_get_first_configured_adapter_in_node(node, &adapter, &cursor); };
  const auto next = [&] { return hb_get_next_configured_adapter_in_node(node, &adapter, &cursor); };
  if (error == no_error) {
    check_walk(expected, HB_NO_ADAPTER, adapter, cursor, hostile, first, next);
    return;
  }
  expect(error, first);
  expect(error, next);
  REQUIRE(adapter == 4711 && cursor == hostile);
}

void walk_networks(const Configuration_Model& model, Hb_Cursor hostile) {
  static Expected<Hb_Network_Number> expected;
  expected.clear();
  for (int network = 0; network < std::min<int>(model.header().adapters_per_node, HB_MAX_NETWORKS); ++network) {
    if (model.is_used_network(network)) {
      expected.add(network, static_cast<Hb_Network_Number>(network));
    }
  }
  Hb_Network_Number network = 0;
  Hb_Cursor cursor = 0;
  check_walk(
      expected, HB_NO_NETWORK, network, cursor, hostile,
      [&] { return hb_get_first_configured_network_number(&network, &cursor); },
      [&] { return hb_get_next_configured_network_number(&network, &cursor); });
}

void walk_adapters_of_network(const Configuration_Model& model, Hb_Network_Number network, Hb_Cursor hostile) {
  static Expected<Hb_Adapter_Number> expected;
  const int error = error_of_network(model, network);
  Hb_Adapter_Number adapter = 4711;
  Hb_Cursor cursor = hostile;
  const auto first = [&] { return hb_get_first_configured_adapter_in_network(network, &adapter, &cursor); };
  const auto next = [&] { return hb_get_next_configured_adapter_in_network(network, &adapter, &cursor); };
  if (error != no_error) {
    expect(error, first);
    expect(error, next);
    REQUIRE(adapter == 4711 && cursor == hostile);
    return;
  }
  expected.clear();
  int position = 0;
  for (const Hb_Adapter& record : model.adapters()) {
    if (record.Hb_network == network) {
      expected.add(position, record.Hb_adapter_num);
    }
    ++position;
  }
  check_walk(expected, HB_NO_ADAPTER, adapter, cursor, hostile, first, next);
}

// Nothing publishes sites.
void walk_sites(Hb_Cursor hostile) {
  static const Expected<Hb_Site_Number> none;
  Hb_Site_Number site = 0;
  Hb_Cursor cursor = 0;
  check_walk(
      none, HB_NO_SITE, site, cursor, hostile, [&] { return hb_get_first_configured_site_number(&site, &cursor); },
      [&] { return hb_get_next_configured_site_number(&site, &cursor); });
}

}  // namespace

void check_queries(Configuration_Model& model, const Hostile& hostile) {
  check_counts(model);
  check_slot(model, hostile);
  check_adapter(model, hostile.adapter);
  check_address(model, hostile);
  check_network_name(model, hostile);
  check_network(model, hostile.network);
  walk_nodes(model, hostile.cursor);
  walk_adapters(model, hostile.cursor);
  walk_adapters_of_node(model, hostile.node, hostile.cursor);
  walk_networks(model, hostile.cursor);
  walk_adapters_of_network(model, hostile.network, hostile.cursor);
  walk_sites(hostile.cursor);
}

}  // namespace fuzz
