// The trace library of a target: every category is on, and every byte that a record is said to have is read.
#include <cstdarg>
#include <cstdint>
#include <cstring>

#include "support/require.h"
#include "zu_tr.h"

namespace {

char token;
volatile unsigned char sink;

void read_all(const void* bytes, size_t length) {
  for (size_t i = 0; i < length; ++i) {
    sink = static_cast<const unsigned char*>(bytes)[i];
  }
}

void check_record(const char* component, tr_file_token given) {
  REQUIRE(std::strcmp(component, "_HBC") == 0 && given == &token);
}

template <typename Step>
void repeat(uint32_t count, Step step) {
  for (uint32_t i = 0; i < count; ++i) {
    step();
  }
}

}  // namespace

extern "C" {

int tr_ms_register_component_1(const char* component, uint8_t* detail_levels, const tr_category* /*categories*/,
                               uint32_t num_categories, tr_file_token* tokens) {
  REQUIRE(num_categories == 3);
  for (uint32_t i = 0; i < num_categories; ++i) {
    detail_levels[i] = 1;
    tokens[i] = &token;
  }
  check_record(component, tokens[0]);
  return 0;
}

void tr_ms_record_id_1(const char* component, uint32_t /*record_id*/, tr_file_token given) {
  check_record(component, given);
}

void tr_ms_record_values_32_1(const char* component, uint32_t /*record_id*/, tr_file_token given, uint32_t count, ...) {
  check_record(component, given);
  REQUIRE(count > 0);
}

void tr_ms_record_data_1(const char* component, uint32_t /*record_id*/, tr_file_token given, uint32_t count, ...) {
  check_record(component, given);
  va_list blocks;
  va_start(blocks, count);
  repeat(count, [&blocks] {
    const void* bytes = va_arg(blocks, const void*);
    read_all(bytes, va_arg(blocks, uint32_t));
  });
  va_end(blocks);
}

void tr_ms_record_strings_1(const char* component, uint32_t /*record_id*/, tr_file_token given, uint32_t count, ...) {
  check_record(component, given);
  va_list texts;
  va_start(texts, count);
  repeat(count, [&texts] {
    const char* text = va_arg(texts, const char*);
    read_all(text, std::strlen(text));
  });
  va_end(texts);
}

}  // extern "C"
