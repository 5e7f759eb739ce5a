// What the environment says of tracing: where records go, and which categories are wanted.
#pragma once

#include <span>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "zu_tr.h"

// Names of the two environment variables.
inline constexpr const char* trace_variable = "ZU_TRACE";
inline constexpr const char* trace_detail_variable = "ZU_TRACE_DETAIL";

// A value that cannot be followed; the text says which, and what would do.
class Trace_Setting_Error : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

enum class Trace_Destination { none, standard_error, system_log, file };

struct Trace_Place {
  Trace_Destination destination = Trace_Destination::none;
  std::string path;  // of the file
};

// Reads the value of ZU_TRACE; null and the empty text mean no tracing. Throws Trace_Setting_Error.
Trace_Place parse_trace_place(const char* value);

// Reads the value of ZU_TRACE_DETAIL: for each category, whether its records are wanted. One of the words "errors",
// "info" and "debug" means the categories up to that default level; several names, separated by commas, mean exactly
// these categories. Null and the empty text mean "info". Throws Trace_Setting_Error.
std::vector<bool> parse_trace_detail(const char* value, std::span<const tr_category> categories);
