// The trace component "_HBC": registration, and making records in one of its three categories.
#pragma once

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <utility>

#include "trace_records.h"
#include "zu_tr.h"

enum Trace_Category : uint32_t { Trace_Errors = 0, Trace_Info = 1, Trace_Debug = 2 };

inline constexpr uint32_t hbc_trace_category_count = 3;

extern int hbc_trace_inited;
extern uint32_t num_categories;
extern uint8_t hbc_trace_detail_levels[hbc_trace_category_count];
extern const tr_category hbc_trace_categories[hbc_trace_category_count];
extern tr_file_token pTokens[hbc_trace_category_count];

void hbc_initialize_trace_once();

inline constexpr const char* hbc_trace_component = "_HBC";

// Making a record changes nothing for its caller, whatever the trace library does to `errno`.
class Errno_Kept {
 public:
  Errno_Kept() = default;
  Errno_Kept(const Errno_Kept&) = delete;
  Errno_Kept& operator=(const Errno_Kept&) = delete;
  ~Errno_Kept() { errno = saved_; }

 private:
  const int saved_ = errno;
};

inline bool trace_is_on(Trace_Category category) { return hbc_trace_detail_levels[category] != 0; }

inline void trace(Trace_Category category, Trace_Record record) {
  if (trace_is_on(category)) {
    const Errno_Kept kept;
    tr_ms_record_id_1(hbc_trace_component, record, pTokens[category]);
  }
}

template <typename... Values>
void trace_values(Trace_Category category, Trace_Record record, Values... values) {
  if (trace_is_on(category)) {
    const Errno_Kept kept;
    tr_ms_record_values_32_1(hbc_trace_component, record, pTokens[category], static_cast<uint32_t>(sizeof...(values)),
                             static_cast<uint32_t>(values)...);
  }
}

inline void trace_text(Trace_Category category, Trace_Record record, const char* text) {
  if (trace_is_on(category)) {
    const Errno_Kept kept;
    tr_ms_record_strings_1(hbc_trace_component, record, pTokens[category], 1, text);
  }
}

// One data block of a record.
struct Trace_Block {
  const void* bytes;
  uint32_t length;
};

// The trace library takes a pointer and a length for each block.
template <size_t Field>
auto field_of(const Trace_Block* blocks) {
  if constexpr (Field % 2 == 0) {
    return blocks[Field / 2].bytes;
  } else {
    return blocks[Field / 2].length;
  }
}

template <size_t... Fields>
void record_blocks(Trace_Category category, Trace_Record record, const Trace_Block* blocks,
                   std::index_sequence<Fields...>) {
  const Errno_Kept kept;
  tr_ms_record_data_1(hbc_trace_component, record, pTokens[category], static_cast<uint32_t>(sizeof...(Fields) / 2),
                      field_of<Fields>(blocks)...);
}

// A record of any number of blocks, as in trace_data(category, record, {{a, 4}, {b, 8}}).
template <size_t Count>
void trace_data(Trace_Category category, Trace_Record record, const Trace_Block (&blocks)[Count]) {
  if (trace_is_on(category)) {
    record_blocks(category, record, blocks, std::make_index_sequence<2 * Count>());
  }
}

// The block of a value.
template <typename Value>
Trace_Block block_of(const Value& value) {
  return {&value, static_cast<uint32_t>(sizeof value)};
}

// The block of a text with its terminator; a missing text is empty.
inline Trace_Block block_of_text(const char* text) {
  const char* shown = text != nullptr ? text : "";
  return {shown, static_cast<uint32_t>(std::strlen(shown) + 1)};
}

// The same of a text of at most so many characters; one that has as many stands without a terminator.
inline Trace_Block block_of_name(const char* name, size_t longest) {
  if (name == nullptr) {
    return {"", 1};
  }
  const size_t length = strnlen(name, longest);
  return {name, static_cast<uint32_t>(length < longest ? length + 1 : length)};
}
