/* The cluster that the daemon simulates when nobody says which. */
#ifndef HBD_BUILT_IN_SCENARIO_H
#define HBD_BUILT_IN_SCENARIO_H

#include <string_view>

namespace hbd {

/** Text of a scenario: 4 nodes on 2 networks, with gentle churn that does not end. */
std::string_view built_in_scenario();

}  // namespace hbd

#endif
