// The trace component "_HBC": registration, and making records in one of its three categories.
#pragma once

#include <cerrno>
#include <cstdint>

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

// One data block of a record.
struct Trace_Block {
  const void* bytes;
  uint32_t length;
};

inline void trace_data(Trace_Category category, Trace_Record record, Trace_Block a, Trace_Block b) {
  if (trace_is_on(category)) {
    const Errno_Kept kept;
    tr_ms_record_data_1(hbc_trace_component, record, pTokens[category], 2, a.bytes, a.length, b.bytes, b.length);
  }
}

inline void trace_data(Trace_Category category, Trace_Record record, Trace_Block a, Trace_Block b, Trace_Block c,
                       Trace_Block d) {
  if (trace_is_on(category)) {
    const Errno_Kept kept;
    tr_ms_record_data_1(hbc_trace_component, record, pTokens[category], 4, a.bytes, a.length, b.bytes, b.length,
                        c.bytes, c.length, d.bytes, d.length);
  }
}
