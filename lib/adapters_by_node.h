// The adapters of the table in force by their node, for who asks for many nodes: the list is walked once.
#pragma once

#include "VEX_EVMONHandler.h"
#include "chain_index.h"

class Adapters_By_Node {
 public:
  Adapters_By_Node() : index_(static_cast<uint32_t>(count())) {
    for (int record = count() - 1; record >= 0; --record) {
      index_.put(static_cast<uint32_t>(record),
                 hash_of(global_config_tbl.Hb_global_adapter_list[record].Hb_adapter_num));
    }
  }

  // Calls use(adapter) for each of the node, in the order of the list, as long as it returns true; false when it did
  // not.
  template <typename Use>
  bool for_each(uint32_t node, Use use) const {
    for (uint32_t record = index_.first(hash_with(0, node)); record != Chain_Index::none;
         record = index_.after(record)) {
      Hb_Adapter& adapter = global_config_tbl.Hb_global_adapter_list[record];
      if (is_adapter_of(global_config_tbl, adapter, node) && !use(adapter)) {
        return false;
      }
    }
    return true;
  }

 private:
  static int count() { return std::max(adapters_in_list(global_config_tbl), 0); }
  static uint32_t hash_of(Hb_Adapter_Number number) {
    const int slots = global_config_tbl.Hb_adapters_per_node;
    return hash_with(0, slots > 0 ? number / static_cast<uint32_t>(slots) : 0);
  }

  Chain_Index index_;
};

// As constructAdapterEventOnNode() for a death.
Hb_Rc construct_adapter_death_on_node(EVMONHandler& handler, zu_int32_t node, Hb_VEX_Event** event,
                                      const Adapters_By_Node& adapters);
