// Configured adapters and nodes by number, without a chain to walk: arrays beside adap_hash and node_hash that lead to
// the same records. An index answers for one table, and only while no entry of any table was replaced or removed;
// otherwise, and for a number that the index does not have, the table itself is searched.
#pragma once

#include <algorithm>
#include <array>

#include "hash_removals.h"
#include "hb_global_data/state.h"

template <typename Record, uint32_t Capacity>
class Record_Index {
 public:
  // Starts anew, empty, for numbers below limit of the table.
  void start(const H_table_str* table, uint32_t limit) {
    table_ = table;
    removals_ = hash_removals;
    limit_ = std::min(limit, Capacity);
    std::fill_n(records_.begin(), end_, nullptr);
    end_ = 0;
  }

  void add(uint32_t number, Record& record) {
    if (number < limit_) {
      records_[number] = &record;
      end_ = std::max(end_, number + 1);
    }
  }

  // The table is about to go.
  void forget() { start(nullptr, 0); }

  // The table's record under the number, or null.
  Record* find(uint32_t number, H_table_str* table) const {
    if (number < limit_ && table == table_ && removals_ == hash_removals && records_[number] != nullptr) {
      return records_[number];
    }
    return static_cast<Record*>(Hash_search(number, table));
  }

 private:
  const H_table_str* table_ = nullptr;
  uint32_t removals_ = 0;
  uint32_t limit_ = 0;
  uint32_t end_ = 0;  // behind the highest number that was added
  std::array<Record*, Capacity> records_{};
};

extern Record_Index<Hb_Adapter, HB_MAX_ADAPTERS> adapter_index;      // of global_config_tbl.adap_hash
extern Record_Index<Hb_Node_config_state, HB_MAX_NODES> node_index;  // of global_config_tbl.node_hash

// Makes both anew from the records of global_config_tbl.
void index_configuration();

// The records of global_config_tbl are about to go.
inline void forget_configuration() {
  adapter_index.forget();
  node_index.forget();
}

inline Hb_Adapter* find_configured_adapter(Hb_Adapter_Number number) {
  return adapter_index.find(number, global_config_tbl.adap_hash);
}

inline Hb_Node_config_state* find_configured_node(uint32_t number) {
  return node_index.find(number, global_config_tbl.node_hash);
}
