// Walking the lists that the platform hands out. A list whose records lead back into it must not hold its reader for
// ever: one that does not end within a number of records that no cluster has counts as ended there.
#pragma once

#include "hb_client/types.h"
#include "zu_vex.h"

// Addresses of interfaces, aliases among them, and nodes.
inline constexpr uint32_t interface_list_limit = 4 * HB_MAX_ADAPTERS;
inline constexpr uint32_t node_list_limit = 16 * HB_MAX_NODES;

template <typename Record, uint32_t limit>
class Platform_List {
 public:
  struct End {};
  class Iterator {
   public:
    explicit Iterator(Record* record) : record_(record) {}
    Record& operator*() const { return *record_; }
    Iterator& operator++() {
      record_ = ++walked_ < limit ? record_->p_next : nullptr;
      return *this;
    }
    bool operator!=(End /*end*/) const { return record_ != nullptr; }

   private:
    Record* record_;
    uint32_t walked_ = 0;
  };

  explicit Platform_List(Record* first) : first_(first) {}
  Iterator begin() const { return Iterator(first_); }
  End end() const { return {}; }

 private:
  Record* first_;
};

inline auto records_of(zu_vex_net_intf_info_t* list) {
  return Platform_List<zu_vex_net_intf_info_t, interface_list_limit>(list);
}
inline auto records_of(const zu_vex_net_intf_info_t* list) {
  return Platform_List<const zu_vex_net_intf_info_t, interface_list_limit>(list);
}
inline auto records_of(const zu_vex_node_info_t* list) {
  return Platform_List<const zu_vex_node_info_t, node_list_limit>(list);
}
