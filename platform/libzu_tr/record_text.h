// What people read of one trace record: the catalogue's text with the record's values in it, always one line.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <variant>

// A data block of the component's; it may be null.
struct Trace_Data {
  const void* bytes;
  uint32_t length;
};

// One value of a record, by the form of the record.
using Trace_Value = std::variant<uint32_t, Trace_Data, const char*>;

// Most bytes of one text and of one hexadecimal block that are shown; what is left out is marked with "...".
inline constexpr uint32_t longest_shown_text = 256;
inline constexpr uint32_t longest_shown_block = 64;

// `text` is the catalogue's, or null for a record that is not in it. Values without a placeholder stand at the end, a
// placeholder without a value becomes "?".
std::string record_text(const char* text, std::span<const Trace_Value> values);
