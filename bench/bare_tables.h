// What the look-ups and the configuration are measured against: chained tables with nothing around them.
#pragma once

#include <cstddef>
#include <cstdint>

#include "hb_client/configuration.h"

namespace bench {

// One entry of a chain, in a block of its own.
struct BareEntry {
  union {
    uint32_t number;
    uint32_t address[4];
  } key;
  void* item;
  BareEntry* next;
  BareEntry* previous;
  int kind;
};

static_assert(sizeof(BareEntry) == 48);

class BareTable {
 public:
  explicit BareTable(uint32_t buckets) : buckets_(new BareEntry*[buckets]()), size_(buckets) {}
  ~BareTable();
  BareTable(const BareTable&) = delete;
  BareTable& operator=(const BareTable&) = delete;

  void* find(uint32_t number) const;

  // False when there is an entry of that key already.
  bool insert(uint32_t number, void* item);
  bool insert(const Hb_IP_address6& address, void* item);

 private:
  BareEntry** buckets_;
  uint32_t size_;
};

// The records of a configuration message and the three tables that lead to them.
class BareConfiguration {
 public:
  explicit BareConfiguration(const char* message);
  ~BareConfiguration();
  BareConfiguration(const BareConfiguration&) = delete;
  BareConfiguration& operator=(const BareConfiguration&) = delete;

  const Hb_Adapter* find(Hb_Adapter_Number number) const { return static_cast<Hb_Adapter*>(by_number_.find(number)); }
  Hb_Adapter* find(Hb_Adapter_Number number) { return static_cast<Hb_Adapter*>(by_number_.find(number)); }
  Hb_Node_config_state* find_node(uint32_t node) { return static_cast<Hb_Node_config_state*>(by_node_.find(node)); }
  Hb_Adapter* adapters() const { return adapters_; }
  size_t count() const { return count_; }

 private:
  void add(Hb_Adapter& adapter, uint32_t node);

  size_t count_;
  Hb_Adapter* adapters_;
  BareTable by_number_;
  BareTable by_node_;
  Hb_Node_config_state* nodes_;
  size_t node_count_ = 0;
  BareTable by_address_;
  Hb_Network networks_[HB_MAX_NETWORKS];
};

}  // namespace bench
