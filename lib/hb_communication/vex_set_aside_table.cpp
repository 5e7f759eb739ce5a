#include "hb_communication/vex_set_aside_table.h"

#include <algorithm>

#include "hb_communication/vex_table_build.h"

Set_Aside_Table::Set_Aside_Table() : table_(global_config_tbl_new), marks_(), marked_nodes_(global_num_nodes) {
  std::copy(std::begin(global_node_tbl), std::end(global_node_tbl), marks_.begin());
  forget_contents(global_config_tbl_new);
}

Set_Aside_Table::~Set_Aside_Table() {
  if (is_replaced_) {
    empty_global_config_table(&table_);
    return;
  }
  empty_global_config_table(&global_config_tbl_new);
  global_config_tbl_new = table_;
  std::copy(marks_.begin(), marks_.end(), std::begin(global_node_tbl));
  global_num_nodes = marked_nodes_;
}
