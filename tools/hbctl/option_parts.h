// What the command lines of several commands are put together from.
#pragma once

#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <string>
#include <vector>

#include "options.h"

namespace hbctl {

constexpr double kLongestSeconds = 1e9;

// A number within limits, the limits included.
template <class Number>
CLI::Validator within(Number least, Number most) {
  const auto check = [least, most](const std::string& text) -> std::string {
    Number number{};
    if (CLI::detail::lexical_cast(text, number) && number >= least && number <= most) return "";
    return fmt::format("'{}' is no number from {} to {}", text, least, most);
  };
  return {check, ""};
}

template <class Number>
CLI::Option* add_numbers(CLI::App& command, const char* name, std::vector<Number>& numbers, const char* text,
                         int limit) {
  return command.add_option(name, numbers, text)->delimiter(',')->check(within(0, limit - 1))->type_name("N");
}

// A command with what every one has.
CLI::App* add_command(CLI::App& app, Options& options, const char* name, const char* text, const char* examples);

}  // namespace hbctl
