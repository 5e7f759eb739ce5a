#include "hb_communication/vex_set_aside_table.h"

#include "hb_communication/vex_table_build.h"

Set_Aside_Table::Set_Aside_Table() : table_(global_config_tbl_new) { forget_contents(global_config_tbl_new); }

Set_Aside_Table::~Set_Aside_Table() {
  if (is_replaced_) {
    empty_global_config_table(&table_);
    return;
  }
  empty_global_config_table(&global_config_tbl_new);
  global_config_tbl_new = table_;
  marks_.put_back();
}

const Hb_Configuration_Internal* Set_Aside_Table::waiting() const { return is_table_built(table_) ? &table_ : nullptr; }
