// Where lines of trace go.
#pragma once

#include <spdlog/common.h>

#include <memory>
#include <string>

#include "trace_settings.h"

// Opens a destination; null for none. Throws std::exception when a file cannot be written, with a text for people.
spdlog::sink_ptr open_trace_sink(const Trace_Place& place);

// Says on standard error what went wrong with tracing, and what follows from it.
void tell_trace_problem(const std::string& problem, const char* consequence);
