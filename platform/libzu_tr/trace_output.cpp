#include "trace_output.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <spdlog/pattern_formatter.h>
#include <spdlog/sinks/base_sink.h>
#include <spdlog/sinks/basic_file_sink.h>
#include <spdlog/sinks/stdout_sinks.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <mutex>
#include <system_error>

namespace {

constexpr mode_t new_file_mode = 0666;  // less the process's mask
constexpr const char* line_pattern = "%Y-%m-%dT%H:%M:%S.%f%z %v";

int syslog_priority(spdlog::level::level_enum level) {
  switch (level) {
    case spdlog::level::err:
      return LOG_ERR;
    case spdlog::level::info:
      return LOG_INFO;
    default:
      return LOG_DEBUG;
  }
}

// Writes to the system log as whoever the program is there: openlog() is the program's to call, not a library's.
class System_Log_Sink : public spdlog::sinks::base_sink<std::mutex> {
 protected:
  void sink_it_(const spdlog::details::log_msg& message) override {
    syslog(LOG_USER | syslog_priority(message.level), "%.*s", static_cast<int>(message.payload.size()),
           message.payload.data());
  }
  void flush_() override {}
};

// Found out beforehand, so that a wrong path yields the system's own reason and creates no directories.
void require_writable(const std::string& path) {
  const int descriptor = open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOCTTY, new_file_mode);
  if (descriptor < 0) {
    throw std::system_error(errno, std::generic_category(), fmt::format("cannot write trace to {}", path));
  }
  close(descriptor);
}

spdlog::sink_ptr open_file(const std::string& path) {
  require_writable(path);
  spdlog::file_event_handlers handlers;
  handlers.after_open = [](const spdlog::filename_t&, std::FILE* file) { fcntl(fileno(file), F_SETFD, FD_CLOEXEC); };
  return std::make_shared<spdlog::sinks::basic_file_sink_mt>(path, false, handlers);
}

spdlog::sink_ptr open_destination(const Trace_Place& place) {
  switch (place.destination) {
    case Trace_Destination::standard_error:
      return std::make_shared<spdlog::sinks::stderr_sink_mt>();
    case Trace_Destination::system_log:
      return std::make_shared<System_Log_Sink>();
    case Trace_Destination::file:
      return open_file(place.path);
    case Trace_Destination::none:
      break;
  }
  return nullptr;
}

}  // namespace

spdlog::sink_ptr open_trace_sink(const Trace_Place& place) {
  spdlog::sink_ptr sink = open_destination(place);
  if (sink) sink->set_formatter(std::make_unique<spdlog::pattern_formatter>(line_pattern));
  return sink;
}

void tell_trace_problem(const std::string& problem, const char* consequence) {
  std::fprintf(stderr, "libzu_tr: %s; %s\n", problem.c_str(), consequence);
}
