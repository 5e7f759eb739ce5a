#include "hb_communication/vex_table_queries.h"

#include <cerrno>

#include "hb_global_data/state.h"

namespace {

bool is_of_category(const zu_evm_event_metadata_t* event, zu_evm_event_category_t one, zu_evm_event_category_t other) {
  return event != nullptr && (event->category == one || event->category == other);
}

Hb_Rc ask_for_cluster(Table_Answers& answers, int saved_errno) {
  static constexpr char call[] = "zu_vex_get_cluster_info()";
  zu_vex_cluster_info_t* info = nullptr;
  const int result = zu_vex_get_cluster_info(&info);
  if (result != 0 || info == nullptr) {
    return fail_table_build({call, sizeof call}, result, saved_errno, HB_EVEXTBL_BUILD);
  }
  answers.cluster.reset(info);
  return Hb_Success;
}

Hb_Rc ask_for_nodes(Table_Answers& answers, const zu_evm_event_metadata_t* event) {
  const bool after_event = is_of_category(event, ZU_EVM_EVENT_CATEGORY_NODE_LIVENESS, ZU_EVM_EVENT_CATEGORY_NODE_LIST);
  zu_vex_node_info_t* list = nullptr;
  const int result = after_event ? zu_vex_get_node_info_after_event(event, &list) : zu_vex_get_node_info(&list);
  if (result != 0) {
    return fail_table_build(
        block_of_text(after_event ? "zu_vex_get_node_info_after_event()" : "zu_vex_get_node_info()"), result, errno,
        HB_EVEXTBL_ENTRY);
  }
  answers.nodes.reset(list);
  return Hb_Success;
}

Hb_Rc ask_for_interfaces(Table_Answers& answers, const zu_evm_event_metadata_t* event) {
  const bool after_event =
      is_of_category(event, ZU_EVM_EVENT_CATEGORY_ADAPTER_LIVENESS, ZU_EVM_EVENT_CATEGORY_IP_CHANGE);
  answers.interface_source =
      block_of_text(after_event ? "zu_vex_get_net_intf_info_after_event()" : "zu_vex_get_net_intf_info()");
  zu_vex_net_intf_info_t* list = nullptr;
  const int result = after_event ? zu_vex_get_net_intf_info_after_event(event, &list) : zu_vex_get_net_intf_info(&list);
  if (result != 0) {
    return fail_table_build(answers.interface_source, result, errno, HB_EVEXTBL_INTF);
  }
  answers.own_interfaces.reset(list);
  answers.interfaces = list;
  return Hb_Success;
}

Hb_Rc ask_or_take_interfaces(Table_Answers& answers, const zu_evm_event_metadata_t* event,
                             const zu_vex_net_intf_info_t* p_src_intf_tbl) {
  if (p_src_intf_tbl == nullptr) {
    return ask_for_interfaces(answers, event);
  }
  answers.interfaces = p_src_intf_tbl;
  answers.interface_source = block_of_text("p_src_intf_tbl");
  return Hb_Success;
}

}  // namespace

Hb_Rc fail_table_build(Trace_Block call, int result, int system_error, int library_error) {
  static constexpr char variant[] = "(Default)";
  set_hb_errno(library_error);
  trace_data(Trace_Errors, trace_table_query_failed,
             {call, {variant, sizeof variant}, block_of(result), block_of(system_error)});
  return Hb_Failure;
}

Hb_Rc ask_cluster_services(Table_Answers& answers, const zu_evm_event_metadata_t* event,
                           const zu_vex_net_intf_info_t* interfaces, int saved_errno) {
  if (ask_for_cluster(answers, saved_errno) != Hb_Success || ask_for_nodes(answers, event) != Hb_Success) {
    return Hb_Failure;
  }
  return ask_or_take_interfaces(answers, event, interfaces);
}
