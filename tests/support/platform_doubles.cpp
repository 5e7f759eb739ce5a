#include "platform_doubles.h"

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <mutex>
#include <stdexcept>

namespace {

constexpr size_t max_categories = 16;
char token_storage[max_categories];

// Records may come from several threads at once; what a test reads, it reads when they are done.
std::mutex& recording_mutex() {
  static std::mutex mutex;
  return mutex;
}

std::string text_or_empty(const char* text) { return text == nullptr ? std::string() : std::string(text); }

int category_of(tr_file_token token) {
  for (size_t index = 0; index < max_categories; ++index) {
    if (token == &token_storage[index]) return static_cast<int>(index);
  }
  return -1;
}

// A trace library may use `errno` before it has read what it is given.
void disturb_errno() {
  if (platform_double().errno_after_trace != 0) errno = platform_double().errno_after_trace;
}

Recorded_Trace new_trace(Trace_Form form, const char* component, uint32_t id, tr_file_token token) {
  disturb_errno();
  return {form, text_or_empty(component), id, token, category_of(token), {}, {}, {}};
}

void record(Recorded_Trace trace) {
  const std::lock_guard<std::mutex> hold(recording_mutex());
  platform_double().traces.push_back(std::move(trace));
  disturb_errno();
}

uint8_t level_of(const std::vector<uint8_t>& levels, size_t category) {
  return category < levels.size() ? levels[category] : uint8_t{0};
}

void fill_levels(const Recorded_Registration& registration, const std::vector<uint8_t>& levels) {
  for (size_t category = 0; category < registration.categories.size(); ++category) {
    registration.levels[category] = level_of(levels, category);
  }
}

std::vector<uint8_t> copy_of(const void* bytes, size_t length) {
  if (bytes == nullptr) return {};
  const auto* first = static_cast<const uint8_t*>(bytes);
  return {first, first + length};
}

sec_key_desc key_from(const Unmarshal_Answer& answer) {
  auto* value = new uint8_t[answer.value.size()];
  std::copy(answer.value.begin(), answer.value.end(), value);
  return {answer.type, answer.version, static_cast<int32_t>(answer.value.size()), value, nullptr};
}

}  // namespace

Platform_Double& platform_double() {
  static Platform_Double instance;
  return instance;
}

std::string Recorded_Trace::block_text(size_t index) const {
  const std::vector<uint8_t>& block = blocks.at(index);
  return {block.begin(), std::find(block.begin(), block.end(), uint8_t{0})};
}

uint32_t Recorded_Trace::block_value(size_t index) const {
  const std::vector<uint8_t>& block = blocks.at(index);
  uint32_t value = 0;
  if (block.size() != sizeof value) throw std::length_error("data block is not a 32-bit value");
  std::memcpy(&value, block.data(), sizeof value);
  return value;
}

void Platform_Double::reset() {
  *this = Platform_Double();
  scripted_cluster().reset();
}

void Platform_Double::set_levels(const std::vector<uint8_t>& new_levels) {
  levels = new_levels;
  for (const Recorded_Registration& registration : registrations) fill_levels(registration, levels);
}

tr_file_token Platform_Double::token(size_t index) {
  if (index >= max_categories) throw std::out_of_range("the double has tokens for 16 categories");
  return &token_storage[index];
}

std::vector<uint32_t> Platform_Double::trace_ids() const {
  std::vector<uint32_t> ids;
  for (const Recorded_Trace& trace : traces) ids.push_back(trace.id);
  return ids;
}

std::vector<Recorded_Trace> Platform_Double::traces_of(uint32_t id) const {
  std::vector<Recorded_Trace> found;
  for (const Recorded_Trace& trace : traces) {
    if (trace.id == id) found.push_back(trace);
  }
  return found;
}

zu_vex_net_intf_info_t* Platform_Double::interface_list(const std::vector<zu_vex_net_intf_info_t>& records) {
  zu_vex_net_intf_info_t* head = nullptr;
  for (auto given = records.rbegin(); given != records.rend(); ++given) {
    interfaces_.push_back(*given);
    zu_vex_net_intf_info_t& kept = interfaces_.back();
    if (given->p_name != nullptr) kept.p_name = interface_names_.emplace_back(given->p_name).data();
    kept.p_next = head;
    head = &kept;
  }
  return head;
}

int tr_ms_register_component_1(const char* component, uint8_t* detail_levels, const tr_category* categories,
                               uint32_t num_categories, tr_file_token* tokens) {
  const std::lock_guard<std::mutex> hold(recording_mutex());
  Platform_Double& platform = platform_double();
  Recorded_Registration registration{text_or_empty(component), {}, detail_levels, tokens};
  for (uint32_t index = 0; index < num_categories; ++index) {
    const tr_category& category = categories[index];
    registration.categories.push_back({category.category_id, text_or_empty(category.category_name),
                                       category.default_level_of_detail, category.minimum_level_of_detail});
    tokens[index] = Platform_Double::token(index);
  }
  fill_levels(registration, platform.levels);
  platform.registrations.push_back(std::move(registration));
  return platform.registration_result;
}

void tr_ms_record_id_1(const char* component, uint32_t record_id, tr_file_token token) {
  record(new_trace(Trace_Form::id, component, record_id, token));
}

void tr_ms_record_values_32_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...) {
  Recorded_Trace trace = new_trace(Trace_Form::values, component, record_id, token);
  va_list arguments;
  va_start(arguments, count);
  for (uint32_t index = 0; index < count; ++index) trace.values.push_back(va_arg(arguments, uint32_t));
  va_end(arguments);
  record(std::move(trace));
}

void tr_ms_record_data_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...) {
  Recorded_Trace trace = new_trace(Trace_Form::data, component, record_id, token);
  va_list arguments;
  va_start(arguments, count);
  for (uint32_t index = 0; index < count; ++index) {
    const void* bytes = va_arg(arguments, const void*);
    const uint32_t length = va_arg(arguments, uint32_t);
    trace.blocks.push_back(copy_of(bytes, length));
  }
  va_end(arguments);
  record(std::move(trace));
}

void tr_ms_record_strings_1(const char* component, uint32_t record_id, tr_file_token token, uint32_t count, ...) {
  Recorded_Trace trace = new_trace(Trace_Form::strings, component, record_id, token);
  va_list arguments;
  va_start(arguments, count);
  for (uint32_t index = 0; index < count; ++index) {
    trace.strings.push_back(text_or_empty(va_arg(arguments, const char*)));
  }
  va_end(arguments);
  record(std::move(trace));
}

void __zu_assert(const char* text, const char* file, int line) {
  {
    const std::lock_guard<std::mutex> hold(recording_mutex());
    platform_double().assertions.push_back({text_or_empty(text), text_or_empty(file), line});
  }
  if (platform_double().assertion_action == Assertion_Action::record_and_return) return;
  std::fprintf(stderr, "assertion failed: %s, file %s, line %d\n", text, file, line);
  std::abort();
}

int sec_unmarshal_typed_key(const sec_buffer* buffer, sec_key_desc* key) {
  Platform_Double& platform = platform_double();
  const auto length = static_cast<size_t>(std::max(buffer->length, 0));
  platform.unmarshals.push_back({buffer->length, copy_of(buffer->value, length), key});
  *key = sec_key_desc{};
  if (platform.unmarshal_answers.empty()) return -1;
  const Unmarshal_Answer answer = platform.unmarshal_answers.front();
  platform.unmarshal_answers.pop_front();
  if (answer.result == 0) *key = key_from(answer);
  return answer.result;
}

void sec_release_typed_key(sec_key_desc* key) {
  platform_double().releases.push_back({key, *key});
  delete[] static_cast<uint8_t*>(key->value);
  *key = sec_key_desc{};
}
