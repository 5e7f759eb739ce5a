/* Scenarios, from their text. */
#ifndef HBD_SCENARIO_PARSER_H
#define HBD_SCENARIO_PARSER_H

#include <string>
#include <string_view>
#include <variant>

#include "scenario.h"

namespace hbd {

/** What is wrong with a scenario, and how to put it right. */
struct ScenarioError {
  unsigned line = 0; /**< from 1; 0 when it concerns the whole text */
  std::string text;
};

/** Reads a scenario in TOML. Any text will do; nothing is thrown. */
std::variant<Scenario, ScenarioError> parse_scenario(std::string_view text);

}  // namespace hbd

#endif
