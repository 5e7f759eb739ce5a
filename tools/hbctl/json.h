// The documented JSON, see hbctl-json.md: every object starts with "version" and "type".
#pragma once

#include <nlohmann/json.hpp>
#include <optional>
#include <string>

#include "errors.h"

namespace hbctl {

using Json = nlohmann::ordered_json;

// Raised when a member changes its meaning or goes away; new members leave it as it is.
constexpr int kJsonVersion = 1;

Json json_object(const char* type);

// What failed, with the library's error name and number when it has one. The lines after the first are advice.
Json error_json(const CommandError& error);

template <class Value>
Json or_null(const std::optional<Value>& value) {
  return value ? Json(*value) : Json(nullptr);
}

std::string json_document(const Json& json);  // indented
std::string json_line(const Json& json);      // on one line

}  // namespace hbctl
