#include "VEX_EVMONNodeLivenessHandler/changes_of_others.h"

#include "table_comparison.h"

namespace {

typedef Hb_Rc (*Worker)(EVMONHandler& handler, const Hb_Configuration_Internal& table1,
                        const Hb_Configuration_Internal& table2, zu_int32_t kind, Hb_VEX_Event** event,
                        zu_int32_t left_out);

Hb_Rc find_deaths(EVMONHandler& handler, Worker worker, zu_int32_t left_out, Owned_Event& event) {
  Hb_VEX_Event* built = nullptr;
  const Hb_Rc rc = worker(handler, global_config_tbl, global_config_tbl_new, HB_EVENT_DEATH, &built, left_out);
  event.reset(built);
  return rc;
}

Hb_Rc find_joins(EVMONHandler& handler, Worker worker, zu_int32_t left_out, Owned_Event& event) {
  Hb_VEX_Event* built = nullptr;
  const Hb_Rc rc = worker(handler, global_config_tbl_new, global_config_tbl, HB_EVENT_JOIN, &built, left_out);
  event.reset(built);
  return rc;
}

}  // namespace

Hb_Rc Changes_Of_Others::find(EVMONHandler& handler, zu_int32_t no_death_of, zu_int32_t no_join_of) {
  const bool found = find_deaths(handler, tell_lost_adapters, no_death_of, adapter_death_) == Hb_Success &&
                     find_deaths(handler, tell_lost_nodes, no_death_of, node_death_) == Hb_Success &&
                     find_joins(handler, tell_lost_nodes, no_join_of, node_join_) == Hb_Success &&
                     find_joins(handler, tell_lost_adapters, no_join_of, adapter_join_) == Hb_Success;
  return found ? Hb_Success : Hb_Failure;
}

Hb_Rc Changes_Of_Others::find_adapter_joins(EVMONHandler& handler) {
  return find_joins(handler, tell_lost_adapters, VEX_no_node, adapter_join_);
}

void Changes_Of_Others::append_deaths() {
  append_event(std::move(adapter_death_));
  append_event(std::move(node_death_));
}

void Changes_Of_Others::append_joins() {
  append_event(std::move(node_join_));
  append_event(std::move(adapter_join_));
}
