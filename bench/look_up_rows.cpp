// Finding adapters by number and by address in the configuration of the largest cluster.
#include <benchmark/benchmark.h>

#include <memory>
#include <random>
#include <unordered_map>

#include "bare_tables.h"
#include "client.h"
#include "rows.h"

namespace bench {
namespace {

constexpr size_t look_ups = 8192;

// The client and, beside it, the same adapters in the tables that it is compared with.
class LookUps {
 public:
  LookUps() : peer_(full_size), client_(peer_), bare_(message()) {
    for (size_t index = 0; index < bare_.count(); ++index) {
      map_.emplace(bare_.adapters()[index].Hb_adapter_num, &bare_.adapters()[index]);
    }
    std::mt19937 random(1);
    for (uint32_t& key : keys_) key = static_cast<uint32_t>(random() % bare_.count());
  }

  static Hb_IP_address6 ours(Hb_Adapter_Number number) {
    Hb_IP_address6 address;
    hb_get_adapter_address_by_number(number, &address);
    return address;
  }
  Hb_IP_address6 in_bare_table(Hb_Adapter_Number number) const { return bare_.find(number)->Hb_ip_address; }
  Hb_IP_address6 in_map(Hb_Adapter_Number number) const { return map_.find(number)->second->Hb_ip_address; }

  // The next keys of an endless random sequence, the same for both sides of a round.
  const uint32_t* keys() {
    const size_t turn = turn_++ / 2 % (keys_.size() / look_ups);
    return keys_.data() + turn * look_ups;
  }

  const BareConfiguration& bare() const { return bare_; }

 private:
  const char* message() {
    message_ = configuration(HB_CONFIGURATION_INFO, full_size);
    return message_.data() + HB_REPLY_HEADER_SIZE;
  }

  Peer peer_;
  Client client_;
  Bytes message_;
  BareConfiguration bare_;
  std::unordered_map<uint32_t, Hb_Adapter*> map_;
  std::vector<uint32_t> keys_ = std::vector<uint32_t>(32 * look_ups);
  size_t turn_ = 0;
};

template <typename Find>
Contender random_look_ups(LookUps& look_ups_of, Find find) {
  return {.prepare = {},
          .run =
              [&look_ups_of, find] {
                const uint32_t* keys = look_ups_of.keys();
                for (size_t index = 0; index < look_ups; ++index) {
                  Hb_IP_address6 address = find(keys[index]);
                  benchmark::DoNotOptimize(address);
                }
              },
          .operations = look_ups};
}

// Each address holds the number that is looked up next.
template <typename Find>
Contender dependent_look_ups(Find find) {
  const auto place = std::make_shared<uint32_t>(0);
  return {.prepare = {},
          .run =
              [place, find] {
                uint32_t number = *place;
                for (size_t index = 0; index < look_ups; ++index) number = number_in_address(find(number));
                *place = number;
              },
          .operations = look_ups};
}

template <typename FindBare>
void compare_random(const Compare& compare, FindBare find_bare) {
  const auto set_up = std::make_unique<LookUps>();
  compare(random_look_ups(*set_up, LookUps::ours),
          random_look_ups(*set_up, [&](Hb_Adapter_Number number) { return find_bare(*set_up, number); }));
}

template <typename FindBare>
void compare_dependent(const Compare& compare, FindBare find_bare) {
  const auto set_up = std::make_unique<LookUps>();
  compare(dependent_look_ups(LookUps::ours),
          dependent_look_ups([&](Hb_Adapter_Number number) { return find_bare(*set_up, number); }));
}

template <typename FindBare>
void add_pair(const std::string& floor, double limit, FindBare find_bare) {
  add_row({.name = "look-up/by number, random", .floor = floor, .limit = limit},
          [find_bare](const Compare& compare) { compare_random(compare, find_bare); });
  add_row({.name = "look-up/by number, dependent", .floor = floor, .limit = limit},
          [find_bare](const Compare& compare) { compare_dependent(compare, find_bare); });
}

// The lowest that a search through every record can cost: one word of each.
uint32_t touch_every_record(const BareConfiguration& bare) {
  uint32_t sum = 0;
  for (size_t index = 0; index < bare.count(); ++index) {
    sum += bare.adapters()[index].Hb_ip_address.v4_in_v6.v4_in_v6_ipv4;
  }
  return sum;
}

void compare_absent_address(const Compare& compare) {
  const auto set_up = std::make_unique<LookUps>();
  const Hb_IP_address6 absent = address_with_number(HB_MAX_ADAPTERS);
  compare(
      {.prepare = {},
       .run =
           [&] {
             Hb_Adapter_Number found = 0;
             hb_get_adapter_number_by_address(absent, &found);
             benchmark::DoNotOptimize(found);
           },
       .operations = 1},
      {.prepare = {}, .run = [&] { benchmark::DoNotOptimize(touch_every_record(set_up->bare())); }, .operations = 1});
}

}  // namespace

void add_look_up_rows() {
  add_pair("bare chained table", 1.3,
           [](const LookUps& in, Hb_Adapter_Number number) { return in.in_bare_table(number); });
  add_pair("std::unordered_map", 1.0, [](const LookUps& in, Hb_Adapter_Number number) { return in.in_map(number); });
  add_row({.name = "look-up/by address, absent", .floor = "loop that touches every record", .limit = 1.10},
          compare_absent_address);
}

}  // namespace bench
