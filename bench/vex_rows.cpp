// VEX mode at the size of the largest cluster: building its table, comparing two of them, and one event to the caller.
#include <benchmark/benchmark.h>
#include <malloc.h>
#include <unistd.h>

#include <cstring>
#include <memory>
#include <stdexcept>

#include "bare_tables.h"
#include "hash.h"
#include "hb_client.h"
#include "rows.h"
#include "vex_tables.h"

namespace bench {
namespace {

constexpr int all_adapters = HB_MAX_ADAPTERS;
constexpr uint32_t node_buckets = 4099;
constexpr Limits few_rounds{.least_rounds = 24, .most_seconds = 60};

uint32_t adapter_buckets() { return static_cast<uint32_t>(prime(2 * all_adapters)); }

// The three tables that lead to adapters by number and address, and to nodes by number.
class BareIndexes {
 public:
  void add(Hb_Adapter& adapter, uint32_t node) {
    by_number_.insert(adapter.Hb_adapter_num, &adapter);
    by_address_.insert(adapter.Hb_ip_address, &adapter);
    by_node_.insert(node, &adapter);
  }

 private:
  BareTable by_number_{adapter_buckets()};
  BareTable by_address_{adapter_buckets()};
  BareTable by_node_{node_buckets};
};

// Records from the services' interfaces, and the tables that lead to them.
class BareBuild {
 public:
  BareBuild() {
    Hb_Adapter* next = adapters_.get();
    uint32_t number = 0;
    for (const auto* interface = all_interfaces(); interface != nullptr; interface = interface->p_next) {
      fill(*next, *interface, number++);
      indexes_.add(*next++, interface->node_number);
    }
  }

 private:
  static void fill(Hb_Adapter& adapter, const zu_vex_net_intf_info_t& interface, uint32_t number) {
    adapter = {};
    std::memcpy(&adapter.Hb_ip_address, &interface.ip_addr, sizeof adapter.Hb_ip_address);
    std::strncpy(adapter.Hb_adapter_type, interface.p_name, sizeof adapter.Hb_adapter_type - 1);
    adapter.Hb_adapter_num = number;
    adapter.Hb_state = Hb_Entity_Up;
  }

  std::unique_ptr<Hb_Adapter[]> adapters_ = std::make_unique_for_overwrite<Hb_Adapter[]>(all_adapters);
  BareIndexes indexes_;
};

// Each build starts with the memory of a new process.
void compare_build(const Compare& compare) {
  all_interfaces();
  std::unique_ptr<BareBuild> bare;
  compare({.prepare =
               [] {
                 release_new_table();
                 malloc_trim(0);
               },
           .run = build_new_table,
           .operations = 1},
          {.prepare =
               [&] {
                 bare.reset();
                 malloc_trim(0);
               },
           .run = [&] { bare = std::make_unique<BareBuild>(); },
           .operations = 1});
  release_new_table();
}

void index(BareIndexes& indexes, Hb_Adapter* adapters) {
  for (int record = 0; record < all_adapters; ++record) {
    indexes.add(adapters[record], adapters[record].Hb_adapter_num / HB_MAX_NETWORKS);
  }
}

struct Two_Indexes {
  BareIndexes first;
  BareIndexes second;
};

void compare_comparison(const Compare& compare) {
  fill_both_tables();
  const auto adapters = std::make_unique<Hb_Adapter[]>(all_adapters);
  std::memcpy(adapters.get(), adapters_in_force(), all_adapters * sizeof(Hb_Adapter));
  std::unique_ptr<Two_Indexes> indexes;
  compare({.prepare = {},
           .run =
               [] {
                 if (compare_tables() != 0) throw std::runtime_error("equal tables differ");
               },
           .operations = 1},
          {.prepare =
               [&] {
                 indexes.reset();
                 malloc_trim(0);
               },
           .run =
               [&] {
                 indexes = std::make_unique<Two_Indexes>();
                 index(indexes->first, adapters.get());
                 index(indexes->second, adapters.get());
               },
           .operations = 1});
  release_both_tables();
}

// A byte through a pipe, and one copy of the group.
class BareDelivery {
 public:
  BareDelivery() {
    if (pipe(ends_) != 0) throw std::runtime_error("no pipe");
  }
  ~BareDelivery() {
    close(ends_[0]);
    close(ends_[1]);
  }
  BareDelivery(const BareDelivery&) = delete;
  BareDelivery& operator=(const BareDelivery&) = delete;

  void deliver_one() {
    char byte = 1;
    if (write(ends_[1], &byte, 1) != 1 || read(ends_[0], &byte, 1) != 1) throw std::runtime_error("no byte");
    std::memcpy(static_cast<void*>(to_.get()), static_cast<const void*>(from_.get()), sizeof *to_);
    benchmark::DoNotOptimize(to_.get());
  }

 private:
  int ends_[2] = {-1, -1};
  std::unique_ptr<Hb_Group> from_ = std::make_unique<Hb_Group>();
  std::unique_ptr<Hb_Group> to_ = std::make_unique<Hb_Group>();
};

void compare_delivery(const Compare& compare) {
  constexpr size_t events = 64;
  Event_Delivery ours;
  BareDelivery bare;
  const auto repeat = [](auto& delivery) {
    return [&delivery] {
      for (size_t event = 0; event < events; ++event) delivery.deliver_one();
    };
  };
  compare({.prepare = {}, .run = repeat(ours), .operations = events},
          {.prepare = {}, .run = repeat(bare), .operations = events});
}

}  // namespace

void add_vex_rows() {
  add_row({.name = "vex/table of 98,352 interfaces, built",
           .floor = "filling the records and three chained tables",
           .limit = 2.0,
           .limits = few_rounds},
          compare_build);
  add_row({.name = "vex/two equal tables of 98,352 adapters, compared",
           .floor = "building the chained tables of both",
           .limit = 3.0,
           .limits = few_rounds},
          compare_comparison);
  add_row(
      {.name = "vex/adapter event, made, queued, taken", .floor = "a byte through a pipe, and one copy of the group"},
      compare_delivery);
}

}  // namespace bench
