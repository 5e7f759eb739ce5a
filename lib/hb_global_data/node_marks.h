// The marks of configured nodes as they are now. A build starts them anew, and one that is not to count puts them back.
#pragma once

#include <algorithm>
#include <iterator>

#include "hb_global_data/state.h"

class Node_Marks {
 public:
  Node_Marks() { std::copy(std::begin(global_node_tbl), std::end(global_node_tbl), marks_); }

  void put_back() const {
    std::copy(std::begin(marks_), std::end(marks_), global_node_tbl);
    global_num_nodes = count_;
  }

 private:
  Hb_Boolean marks_[HB_MAX_NODES];
  int32_t count_ = global_num_nodes;
};
