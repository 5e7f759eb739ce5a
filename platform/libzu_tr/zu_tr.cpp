// Trace: components, their categories, and the records that they make.
#include "zu_tr.h"

#include <pthread.h>
#include <spdlog/logger.h>

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <cstdlib>
#include <deque>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "catalogue.h"
#include "record_text.h"
#include "trace_output.h"
#include "trace_settings.h"

namespace {

constexpr const char* stays_off = "trace stays off";
constexpr const char* is_incomplete = "trace is incomplete from here on";

// One category of one component: what a token points to. Without a logger its records are not wanted.
struct Category_Trace {
  std::string name;
  spdlog::level::level_enum severity;
  std::unique_ptr<spdlog::logger> logger;
};

// What the process traces. It is never destroyed, since records are made until the very end of a process.
struct Process_Trace {
  std::mutex mutex;  // guards registration; records need no more than their own category
  bool opened = false;
  bool told_detail = false;
  spdlog::sink_ptr sink;
  std::deque<Category_Trace> categories;  // addresses are tokens
};

Process_Trace& process_trace() {
  static auto* const instance = new Process_Trace;
  return *instance;
}

// A caller's `errno` is its own, and a thread is not cancelled in the middle of a record.
class Undisturbed_Caller {
 public:
  Undisturbed_Caller() : errno_(errno) { pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &cancel_state_); }
  ~Undisturbed_Caller() {
    int disabled = 0;
    pthread_setcancelstate(cancel_state_, &disabled);
    errno = errno_;
  }
  Undisturbed_Caller(const Undisturbed_Caller&) = delete;
  Undisturbed_Caller& operator=(const Undisturbed_Caller&) = delete;

 private:
  int errno_;
  int cancel_state_ = PTHREAD_CANCEL_ENABLE;
};

// The environment of a program that runs with more rights than its caller is not trusted.
const char* setting(const char* variable) { return secure_getenv(variable); }

spdlog::sink_ptr open_sink_or_tell() {
  try {
    return open_trace_sink(parse_trace_place(setting(trace_variable)));
  } catch (const std::exception& problem) {
    tell_trace_problem(problem.what(), stays_off);
    return nullptr;
  }
}

// The destination is opened by the first registration of the process.
void open_once(Process_Trace& process) {
  if (process.opened) return;
  process.sink = open_sink_or_tell();
  process.opened = true;
}

std::vector<bool> wanted_categories(Process_Trace& process, std::span<const tr_category> categories) {
  if (!process.sink) return std::vector<bool>(categories.size(), false);
  try {
    return parse_trace_detail(setting(trace_detail_variable), categories);
  } catch (const Trace_Setting_Error& problem) {
    if (!process.told_detail) tell_trace_problem(problem.what(), stays_off);
    process.told_detail = true;
    return std::vector<bool>(categories.size(), false);
  }
}

spdlog::level::level_enum severity_of(const tr_category& category) {
  if (category.default_level_of_detail == 0) return spdlog::level::err;
  return category.default_level_of_detail == 1 ? spdlog::level::info : spdlog::level::debug;
}

// A destination that fails later, as on a full disk, is told of once.
void tell_once(const std::string& problem) {
  static std::once_flag told;
  std::call_once(told, [&problem] { tell_trace_problem(problem, is_incomplete); });
}

std::unique_ptr<spdlog::logger> new_logger(const char* component, const spdlog::sink_ptr& sink) {
  auto logger = std::make_unique<spdlog::logger>(component, sink);
  logger->set_level(spdlog::level::trace);
  logger->flush_on(spdlog::level::trace);
  logger->set_error_handler(tell_once);
  return logger;
}

Category_Trace new_category(const char* component, const tr_category& category, const spdlog::sink_ptr& sink,
                            bool wanted) {
  return {category.category_name == nullptr ? "" : category.category_name, severity_of(category),
          wanted ? new_logger(component, sink) : nullptr};
}

uint8_t level_when_on(const tr_category& category) {
  return static_cast<uint8_t>(std::clamp<uint32_t>(category.default_level_of_detail, 1, UINT8_MAX));
}

void register_component(const char* component, uint8_t* levels, std::span<const tr_category> categories,
                        tr_file_token* tokens) {
  Process_Trace& process = process_trace();
  const std::lock_guard<std::mutex> hold(process.mutex);
  open_once(process);
  const std::vector<bool> wanted = wanted_categories(process, categories);
  std::vector<Category_Trace> made;
  for (size_t index = 0; index < categories.size(); ++index) {
    made.push_back(new_category(component, categories[index], process.sink, wanted[index]));
  }
  for (size_t index = 0; index < categories.size(); ++index) {
    process.categories.push_back(std::move(made[index]));
    tokens[index] = &process.categories.back();
    levels[index] = wanted[index] ? level_when_on(categories[index]) : uint8_t{0};
  }
}

Category_Trace* wanted_category(tr_file_token token) {
  auto* category = static_cast<Category_Trace*>(token);
  return category != nullptr && category->logger ? category : nullptr;
}

void write_record(const char* component, uint32_t record_id, Category_Trace& category,
                  std::span<const Trace_Value> values) {
  const char* name = component == nullptr ? "?" : component;
  const std::string text = record_text(catalogue_text(name, record_id), values);
  category.logger->log(category.severity, fmt::format("{} {} {} {}", name, category.name, record_id, text));
}

// Takes `count` values off the arguments, each with `next`, and writes the record if it is wanted.
template <typename Next>
void record(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, Next next) {
  Category_Trace* category = wanted_category(token);
  if (category == nullptr) return;
  const Undisturbed_Caller undisturbed;
  try {
    std::vector<Trace_Value> values;
    for (uint32_t index = 0; index < count; ++index) values.push_back(next());
    write_record(component, record_id, *category, values);
  } catch (const std::exception& problem) {
    tell_once(problem.what());
  }
}

}  // namespace

int tr_ms_register_component_1(const char* component, uint8_t* detail_levels, const tr_category* categories,
                               uint32_t num_categories, tr_file_token* tokens) {
  if (component == nullptr || detail_levels == nullptr || categories == nullptr || tokens == nullptr) return -1;
  const Undisturbed_Caller undisturbed;
  try {
    register_component(component, detail_levels, {categories, num_categories}, tokens);
    return 0;
  } catch (const std::exception&) {
    return -1;
  }
}

void tr_ms_record_id_1(const char* component, uint32_t record_id, tr_file_token token) {
  record(component, record_id, token, 0, [] { return Trace_Value{}; });
}

void tr_ms_record_values_32_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...) {
  va_list arguments;
  va_start(arguments, count);
  record(component, record_id, token, count, [&arguments] { return Trace_Value{va_arg(arguments, uint32_t)}; });
  va_end(arguments);
}

void tr_ms_record_data_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...) {
  va_list arguments;
  va_start(arguments, count);
  record(component, record_id, token, count, [&arguments] {
    const void* bytes = va_arg(arguments, const void*);
    return Trace_Value{Trace_Data{bytes, va_arg(arguments, uint32_t)}};
  });
  va_end(arguments);
}

void tr_ms_record_strings_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...) {
  va_list arguments;
  va_start(arguments, count);
  record(component, record_id, token, count, [&arguments] { return Trace_Value{va_arg(arguments, const char*)}; });
  va_end(arguments);
}
