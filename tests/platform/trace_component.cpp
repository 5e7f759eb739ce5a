#include "trace_component.h"

#include <cstdlib>
#include <fstream>
#include <regex>
#include <sstream>

namespace {

const std::array<tr_category, 3> categories = {{{0, "Errors", 0, 0}, {1, "Info", 1, 0}, {2, "Debug", 2, 0}}};

void set_variable(const char* name, const char* value) {
  if (value == nullptr) {
    unsetenv(name);
  } else {
    setenv(name, value, 1);
  }
}

std::vector<std::string> lines_of(std::istream& stream) {
  std::vector<std::string> lines;
  for (std::string line; std::getline(stream, line);) lines.push_back(line);
  return lines;
}

}  // namespace

int Trace_Component::register_it() {
  return tr_ms_register_component_1(name.c_str(), levels.data(), categories.data(),
                                    static_cast<uint32_t>(categories.size()), tokens.data());
}

void set_trace(const char* place, const char* detail) {
  set_variable("ZU_TRACE", place);
  set_variable("ZU_TRACE_DETAIL", detail);
}

std::vector<std::string> lines_of_file(const std::string& path) {
  std::ifstream file(path);
  return lines_of(file);
}

std::vector<std::string> without_times(const std::vector<std::string>& lines) {
  static const std::regex time(R"(^\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{6}[+-]\d\d:\d\d )");
  std::vector<std::string> out;
  out.reserve(lines.size());
  for (const std::string& line : lines) out.push_back(std::regex_replace(line, time, ""));
  return out;
}

std::vector<std::string> without_times(const std::string& text) {
  std::istringstream stream(text);
  return without_times(lines_of(stream));
}
