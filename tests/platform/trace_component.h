// A component as it meets the trace library, and what its lines of trace look like.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "zu_tr.h"

enum { errors = 0, info = 1, debug = 2 };

// Three categories: "Errors", "Info" and "Debug", with the default levels 0, 1 and 2.
struct Trace_Component {
  std::string name = "_HBC";
  std::array<uint8_t, 3> levels = {7, 7, 7};
  std::array<tr_file_token, 3> tokens = {};

  int register_it();
};

// Sets the two variables that switch trace; a null value removes one.
void set_trace(const char* place, const char* detail);

std::vector<std::string> lines_of_file(const std::string& path);

// The lines of `text` without their times; a line that does not begin with a time is given back as it is.
std::vector<std::string> without_times(const std::vector<std::string>& lines);
std::vector<std::string> without_times(const std::string& text);
