#include "support/subscription_check.h"

#include <array>

#include "hb_client.h"
#include "hb_protocol/requests.h"
#include "support/conventions.h"
#include "support/system.h"

namespace fuzz {

namespace {

// Bytes of each kind's set, and the type that an empty group takes when a member of the kind is changed.
struct Kind {
  size_t set_length;
  int32_t type;
};
constexpr std::array<Kind, 4> kinds = {{{12294, 2}, {12294, 5}, {257, 0}, {1, 7}}};

constexpr size_t part_that_changes = 512;  // of the record: header, count, and members of a small cluster
constexpr uint32_t set_bits = 98352;

constexpr int32_t sites = 0x60;
constexpr int32_t splits_and_merges = 0x3000;
constexpr int32_t different_instance = 0x100;
constexpr int32_t allowed_events = 0x7377;

// Byte for byte, the bytes between fields included: nobody writes those.
bool is_equal(const void* a, const void* b, size_t length) { return std::memcmp(a, b, length) == 0; }

// Operations that send report what came of that, too; in a target every send goes well.
constexpr size_t payload = 4 + 76;

}  // namespace

Subscription_Check::Subscription_Check(Configuration_Model& model, const Hostile& hostile) : model_(model) {
  std::memset(&group_, 0, sizeof group_);
  group_.Hb_subscription_type = static_cast<Hb_Subscription_Type>(hostile.subscription_type);
  group_.Hb_cursor = hostile.cursor;
  group_.Hb_events = hostile.group_events;
  auto& members = group_.Hb_subscription_grp_union.Hb_adapter_subscription_grp;
  members.Hb_num_adapters = hostile.subscription_count;
  std::memcpy(members.Hb_adapter_list, hostile.members, sizeof hostile.members);
  std::memcpy(members.Hb_adapter_list + HB_ADAPTER_SET_LENGTH - sizeof hostile.members, hostile.members,
              sizeof hostile.members);
  std::memcpy(&expected_, &group_, sizeof expected_);
}

void Subscription_Check::perform(unsigned operation, const Hostile& hostile) {
  switch (operation % operations) {
    case 0:
      return empty();
    case 1:
      return add_all_adapters();
    case 2:
      return add_all_nodes();
    case 3:
      return add_all_sites();
    case 4:
      return change(Member::adapter, true, hostile);
    case 5:
      return change(Member::adapter, false, hostile);
    case 6:
      return change(Member::network, true, hostile);
    case 7:
      return change(Member::network, false, hostile);
    case 8:
      return change(Member::node, true, hostile);
    case 9:
      return change(Member::node, false, hostile);
    case 10:
      return change(Member::site, true, hostile);
    case 11:
      return change(Member::site, false, hostile);
    case 12:
      return walk(Member::adapter, true);
    case 13:
      return walk(Member::adapter, false);
    case 14:
      return walk(Member::node, true);
    case 15:
      return walk(Member::node, false);
    case 16:
      return walk(Member::site, true);
    case 17:
      return walk(Member::site, false);
    case 18:
      return subscribe(hostile);
    default:
      return unsubscribe(hostile);
  }
}

void Subscription_Check::compare() const { REQUIRE(is_equal(&group_, &expected_, part_that_changes)); }

void Subscription_Check::compare_all() const { REQUIRE(is_equal(&group_, &expected_, sizeof group_)); }

bool Subscription_Check::contains(uint32_t number) const { return (set()[number / 8] >> (7 - number % 8) & 1) != 0; }

void Subscription_Check::put(uint32_t number, bool add) {
  if (number >= set_bits || contains(number) == add) {
    return;
  }
  set()[number / 8] = static_cast<uint8_t>(set()[number / 8] ^ 1U << (7 - number % 8));
  count() = static_cast<int32_t>(static_cast<uint32_t>(count()) + (add ? 1U : UINT32_MAX));
}

void Subscription_Check::reset(Member member) {
  const Kind& kind = kinds[static_cast<size_t>(member)];
  std::memset(set(), 0, kind.set_length);
  count() = 0;
  expected_.Hb_subscription_type = static_cast<Hb_Subscription_Type>(kind.type);
}

void Subscription_Check::empty() {
  expect(no_error, [this] { return hb_empty_subscription_group(&group_); });
  expected_.Hb_subscription_type = Hb_Empty_Subscription;
  compare();
}

void Subscription_Check::add_all_adapters() {
  expect(no_error, [this] { return hb_add_all_adapters_to_subscription_group(&group_); });
  reset(Member::adapter);
  for (const Hb_Adapter& adapter : model_.adapters()) {
    put(adapter.Hb_adapter_num, true);
  }
  count() = model_.header().num_adapters;
  compare();
}

void Subscription_Check::add_all_nodes() {
  expect(no_error, [this] { return hb_add_all_nodes_to_subscription_group(&group_); });
  reset(Member::node);
  for (int node = 0; node < model_.header().max_nodes; ++node) {
    if (model_.is_present(node)) {
      put(static_cast<uint32_t>(node), true);
    }
  }
  count() = model_.present_nodes();
  compare();
}

void Subscription_Check::add_all_sites() {
  expect(no_error, [this] { return hb_add_all_sites_to_subscription_group(&group_); });
  reset(Member::site);
  compare();
}

int Subscription_Check::error_of(Member member, const Hostile& hostile) {
  switch (member) {
    case Member::adapter:
      return hostile.adapter >= model_.adapter_limit() ? int{HB_EINVAL}
             : model_.has(hostile.adapter)             ? no_error
                                                       : int{HB_ENOADAPTER};
    case Member::network:
      return !model_.is_network_number(hostile.network) ? int{HB_EINVAL}
             : model_.is_used_network(hostile.network)  ? no_error
                                                        : int{HB_ENONETWORK};
    case Member::node:
      return !model_.is_node_number(hostile.node) ? int{HB_EINVAL}
             : model_.is_present(hostile.node)    ? no_error
                                                  : int{HB_ENONODE};
    default:
      return HB_EINVAL;  // there is no site
  }
}

Hb_Rc Subscription_Check::call_change(Member member, bool add, const Hostile& hostile) {
  switch (member) {
    case Member::adapter:
      return add ? hb_add_adapter_to_subscription_group(&group_, hostile.adapter)
                 : hb_remove_adapter_from_subscription_group(&group_, hostile.adapter);
    case Member::network:
      return add ? hb_add_network_to_subscription_group(&group_, hostile.network)
                 : hb_remove_network_from_subscription_group(&group_, hostile.network);
    case Member::node:
      return add ? hb_add_node_to_subscription_group(&group_, hostile.node)
                 : hb_remove_node_from_subscription_group(&group_, hostile.node);
    default:
      return add ? hb_add_site_to_subscription_group(&group_, hostile.site)
                 : hb_remove_site_from_subscription_group(&group_, hostile.site);
  }
}

Subscription_Check::Action Subscription_Check::action_of(Member member, int32_t type) {
  // By type from 0 to 9: p proceeds, x is refused, r starts a set of the member's kind.
  static constexpr std::array<const char*, 4> actions = {"xppprppxpp", "xpxprxpxpp", "ppxprppxpp", "xpxprppppp"};
  if (type < 0 || type > 9) {
    return Action::reject;
  }
  switch (actions[static_cast<size_t>(member)][type]) {
    case 'p':
      return Action::proceed;
    case 'r':
      return Action::reset;
    default:
      return Action::reject;
  }
}

void Subscription_Check::put_members(Member member, bool add, const Hostile& hostile) {
  if (member == Member::adapter) {
    put(hostile.adapter, add);
  } else if (member == Member::node) {
    put(static_cast<uint32_t>(hostile.node), add);
  } else {
    for (const Hb_Adapter& adapter : model_.adapters()) {
      if (adapter.Hb_network == hostile.network) {
        put(adapter.Hb_adapter_num, add);
      }
    }
  }
}

void Subscription_Check::change(Member member, bool add, const Hostile& hostile) {
  const int number_error = error_of(member, hostile);
  const Action action = action_of(member, expected_.Hb_subscription_type);
  const int type_error = action == Action::reject ? int{HB_ESUBSCRIBE} : no_error;
  const int error = number_error != no_error ? number_error : type_error;
  expect(error, [&] { return call_change(member, add, hostile); });
  if (error == no_error) {
    if (action == Action::reset) {
      reset(member);
    }
    if (add || action == Action::proceed) {
      put_members(member, add, hostile);
    }
  }
  compare();
}

void Subscription_Check::walk(Member member, bool from_start) {
  struct Pair {
    int32_t type;
    uint32_t bound;
    uint32_t none;
  };
  const Pair pair = member == Member::adapter ? Pair{2, model_.adapter_limit(), 0xFFFFFFFFU}
                    : member == Member::node  ? Pair{0, static_cast<uint32_t>(model_.header().max_nodes), 0xFFFFU}
                                              : Pair{7, 0, 0xFFFFU};
  Hb_Adapter_Number adapter = 4711;
  Hb_Node_Number node = 4711;
  Hb_Site_Number site = 4711;
  const auto call = [&] {
    switch (member) {
      case Member::adapter:
        return from_start ? hb_get_first_subscription_adapter(&group_, &adapter)
                          : hb_get_next_subscription_adapter(&group_, &adapter);
      case Member::node:
        return from_start ? hb_get_first_subscription_node(&group_, &node)
                          : hb_get_next_subscription_node(&group_, &node);
      default:
        return from_start ? hb_get_first_subscription_site(&group_, &site)
                          : hb_get_next_subscription_site(&group_, &site);
    }
  };
  int64_t position = from_start ? 0 : expected_.Hb_cursor;
  position = position < 0 ? int64_t{pair.bound} : position;
  while (position < pair.bound && !contains(static_cast<uint32_t>(position))) {
    ++position;
  }
  const bool wrong_type = expected_.Hb_subscription_type != pair.type;
  const bool found = position < pair.bound;
  expect(wrong_type ? int{HB_ESUBSCRIBE} : found ? no_error : int{HB_ENOMORE}, call);
  const uint32_t item = member == Member::adapter ? adapter
                        : member == Member::node  ? static_cast<uint16_t>(node)
                                                  : uint32_t{site};
  REQUIRE(item == (wrong_type ? 4711U : found ? static_cast<uint32_t>(position) : pair.none));
  if (!wrong_type && found) {
    expected_.Hb_cursor = static_cast<Hb_Cursor>(position + 1);
  }
  compare();
}

int32_t Subscription_Check::type_to_send(int32_t events) const {
  const int32_t type = expected_.Hb_subscription_type;
  const int32_t members = expected_.Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_num_adapters;
  switch (events) {
    case different_instance:
      return 6;
    case splits_and_merges:
      return 9;
    case sites:
      return 8;
    default:
      if (type == 2 && members == model_.header().num_adapters) {
        return 3;
      }
      return type == 0 && members == model_.present_nodes() ? 1 : type;
  }
}

void Subscription_Check::check_sent(int32_t type, int32_t events) const {
  const Sent& sent = the_system.sent;
  REQUIRE(sent.length == payload + 12348);
  REQUIRE(sent.at<int32_t>(0) == 76 + 12348);
  REQUIRE(sent.at<int32_t>(4 + offsetof(packet_str, kind)) == 209);
  REQUIRE(sent.at<int32_t>(4 + offsetof(packet_str, len)) == 12348);
  REQUIRE(sent.at<int32_t>(payload) == type);
  REQUIRE(sent.at<int32_t>(payload + 8) == events);
}

void Subscription_Check::subscribe(const Hostile& hostile) {
  const int32_t events = hostile.subscription_events;
  char name[sizeof hostile.address + sizeof hostile.address + 4] = {};
  std::memcpy(name, hostile.address, sizeof hostile.address);
  std::memcpy(name + std::strlen(name), hostile.members, sizeof hostile.members);
  const int32_t type = type_to_send(events);
  const int error = events == 0 || (events & ~allowed_events) != 0 ? int{HB_EINVAL}
                    : type == Hb_Empty_Subscription                ? int{HB_ESUBSCRIBE}
                                                                   : no_error;
  expect(error, [&] { return hb_subscribe(name, &group_, events); });
  if (error == no_error) {
    check_sent(type, events);
    REQUIRE(std::strncmp(group_.Hb_name, name, 31) == 0 && group_.Hb_name[31] == '\0');
    std::memcpy(expected_.Hb_name, group_.Hb_name, sizeof expected_.Hb_name);
    expected_.Hb_events = events;
    const int32_t left = events == sites ? 7
                         : events == different_instance || events == splits_and_merges
                             ? type
                             : int32_t{expected_.Hb_subscription_type};
    expected_.Hb_subscription_type = static_cast<Hb_Subscription_Type>(left);
  }
  compare();
}

void Subscription_Check::unsubscribe(const Hostile& hostile) {
  char name[40] = {};
  std::memcpy(name, hostile.address, sizeof hostile.address);
  if ((hostile.flags & name_of_a_network) != 0) {
    std::memset(name, 'n', sizeof name - 1);
  }
  expect(no_error, [&name] { return hb_unsubscribe(name); });
  const size_t length = std::min<size_t>(std::strlen(name), 31);
  const Sent& sent = the_system.sent;
  REQUIRE(sent.length == payload + length + 1);
  REQUIRE(sent.at<int32_t>(4 + offsetof(packet_str, kind)) == 210);
  REQUIRE(sent.at<int32_t>(4 + offsetof(packet_str, len)) == static_cast<int32_t>(length) + 1);
  REQUIRE(std::memcmp(sent.front.data() + payload, name, length) == 0 && sent.front[payload + length] == '\0');
}

}  // namespace fuzz
