// Rows of the table: each is one benchmark that measures a pair and hands the figures over as its counters.
#pragma once

#include <functional>
#include <string>

#include "sampling.h"

namespace bench {

struct Row {
  std::string name;   // "group/what"
  std::string floor;  // what it is measured against
  double limit = 0;   // greatest allowed ratio; 0 for a row that is only informative
  Limits limits = {};
};

// Sets up, calls the function that it is given once with the two contenders, and clears up. A failure is thrown.
using Compare = std::function<void(const Contender& ours, const Contender& floor)>;
using Body = std::function<void(const Compare& compare)>;

void add_row(const Row& row, const Body& body);

// A pair that measures itself, for information.
void add_figures(const std::string& name, const std::string& floor, const std::function<Comparison()>& figures);

// A figure in bytes, without a pair.
void add_memory_row(const std::string& name, const std::function<double()>& bytes);

// Each registers the rows of its group.
void add_event_rows();
void add_turn_rows();
void add_configuration_rows();
void add_look_up_rows();
void add_walk_rows();
void add_request_rows();
void add_steering_rows();
void add_route_rows();
void add_notification_rows();
void add_vex_rows();
void add_memory_rows();
void add_daemon_rows();
void add_daemon_memory_rows();

}  // namespace bench
