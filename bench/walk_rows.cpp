// Walking the few members of a large group or subscription.
#include <benchmark/benchmark.h>

#include <cstring>
#include <memory>

#include "client.h"
#include "rows.h"

namespace bench {
namespace {

constexpr size_t walks = 8;

void fill_group(Hb_Group& group) {
  group.Hb_group_type = Hb_Adapter_Group;
  auto& members = group.Hb_membership_grp_union.Hb_adapter_membership_grp;
  std::memset(members.Hb_adapter_list, 0xFF, sizeof members.Hb_adapter_list);
  for (const size_t number : {7U, 49176U, 98345U}) members.Hb_adapter_list[number] = 1;
}

// From the first member to the end of the list.
void walk_group(Hb_Group& group) {
  Hb_Adapter_Identifier member;
  for (Hb_Rc result = hb_get_first_adapter(&group, &member); result == Hb_Success;) {
    benchmark::DoNotOptimize(member);
    result = hb_get_next_adapter(&group, &member);
  }
}

void walk_group_bare(const Hb_Group& group) {
  const auto& members = group.Hb_membership_grp_union.Hb_adapter_membership_grp;
  for (uint32_t number = 0; number < HB_MAX_ADAPTERS; ++number) {
    if (members.Hb_adapter_list[number] != HB_NOT_IN_GROUP) benchmark::DoNotOptimize(number);
  }
}

void compare_group_walk(const Compare& compare) {
  const Peer peer(full_size);
  const Client client(peer);
  const auto group = std::make_unique<Hb_Group>();
  fill_group(*group);
  compare({.prepare = {},
           .run =
               [&] {
                 for (size_t walk = 0; walk < walks; ++walk) walk_group(*group);
               },
           .operations = walks},
          {.prepare = {},
           .run =
               [&] {
                 for (size_t walk = 0; walk < walks; ++walk) walk_group_bare(*group);
               },
           .operations = walks});
}

// Position of the first byte that is not 0.
template <typename Word>
size_t first_used_word(const unsigned char* bytes, size_t size) {
  for (size_t position = 0; position + sizeof(Word) <= size; position += sizeof(Word)) {
    Word word;
    std::memcpy(&word, bytes + position, sizeof word);
    if (word != 0) return position;
  }
  return size;
}

// Walks to the one member, the last adapter, and on to the end.
void walk_subscription(Hb_Subscription_Group& group) {
  Hb_Adapter_Number member = 0;
  for (Hb_Rc result = hb_get_first_subscription_adapter(&group, &member); result == Hb_Success;) {
    benchmark::DoNotOptimize(member);
    result = hb_get_next_subscription_adapter(&group, &member);
  }
}

template <typename Word>
void compare_subscription_walk(const Compare& compare) {
  const Peer peer(full_size);
  const Client client(peer);
  const auto group = std::make_unique<Hb_Subscription_Group>();
  require(hb_empty_subscription_group(group.get()), "hb_empty_subscription_group");
  require(hb_add_adapter_to_subscription_group(group.get(), HB_MAX_ADAPTERS - 1), "adding an adapter");
  const auto& members = group->Hb_subscription_grp_union.Hb_adapter_subscription_grp;
  compare(
      {.prepare = {},
       .run =
           [&] {
             for (size_t walk = 0; walk < walks; ++walk) walk_subscription(*group);
           },
       .operations = walks},
      {.prepare = {},
       .run =
           [&] {
             for (size_t walk = 0; walk < walks; ++walk) {
               benchmark::DoNotOptimize(first_used_word<Word>(members.Hb_adapter_list, sizeof members.Hb_adapter_list));
             }
           },
       .operations = walks});
}

}  // namespace

void add_walk_rows() {
  add_row({.name = "walk/group, 3 of 98,352", .floor = "loop over the list", .limit = 1.5}, compare_group_walk);
  add_row({.name = "walk/subscription, 1 of 98,352", .floor = "loop over the bytes of the set", .limit = 1.5},
          compare_subscription_walk<uint8_t>);
  add_row({.name = "walk/subscription, 1 of 98,352", .floor = "loop over the set, 8 bytes at once", .limit = 0},
          compare_subscription_walk<uint64_t>);
}

}  // namespace bench
