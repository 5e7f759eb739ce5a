// The new table that waits for its configuration event, while another is built in its place.
#pragma once

#include "hb_global_data/node_marks.h"

// Takes what waits out of global_config_tbl_new, which is empty then, and puts it back at the end, together with the
// marks of nodes that belong to it, unless the table that was built since is to stay. What was built and is not told
// never takes effect so.
class Set_Aside_Table {
 public:
  Set_Aside_Table();
  ~Set_Aside_Table();
  Set_Aside_Table(const Set_Aside_Table&) = delete;
  Set_Aside_Table& operator=(const Set_Aside_Table&) = delete;

  void keep_new_table() { is_replaced_ = true; }

  // The table that waits, or null.
  const Hb_Configuration_Internal* waiting() const;

 private:
  Hb_Configuration_Internal table_;
  Node_Marks marks_;
  bool is_replaced_ = false;
};
