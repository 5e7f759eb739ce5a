// Operations on a subscription group, each compared with a second record that is changed by the rules alone.
#pragma once

#include "hb_client/subscription.h"
#include "support/configuration_model.h"
#include "support/hostile.h"

namespace fuzz {

class Subscription_Check {
 public:
  // Every operation has a number below this.
  static constexpr unsigned operations = 20;

  // Starts from a record whose type, cursor, count and first members come from the input.
  Subscription_Check(Configuration_Model& model, const Hostile& hostile);

  // Performs one operation with the arguments in hostile, and checks what it did.
  void perform(unsigned operation, const Hostile& hostile);

  // Compares every byte of the record, where perform compares those that are likely to change.
  void compare_all() const;

 private:
  enum class Member { adapter, network, node, site };
  enum class Action { proceed, reject, reset };

  void empty();
  void add_all_adapters();
  void add_all_nodes();
  void add_all_sites();
  void change(Member member, bool add, const Hostile& hostile);
  void walk(Member member, bool from_start);
  void subscribe(const Hostile& hostile);
  void unsubscribe(const Hostile& hostile);

  int error_of(Member member, const Hostile& hostile);
  Hb_Rc call_change(Member member, bool add, const Hostile& hostile);
  static Action action_of(Member member, int32_t type);
  void reset(Member member);
  void put(uint32_t number, bool add);
  bool contains(uint32_t number) const;
  void put_members(Member member, bool add, const Hostile& hostile);
  int32_t type_to_send(int32_t events) const;
  void check_sent(int32_t type, int32_t events) const;
  void compare() const;

  uint8_t* set() { return expected_.Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_adapter_list; }
  const uint8_t* set() const { return expected_.Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_adapter_list; }
  int32_t& count() { return expected_.Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_num_adapters; }

  Configuration_Model& model_;
  Hb_Subscription_Group group_;
  Hb_Subscription_Group expected_;
};

}  // namespace fuzz
