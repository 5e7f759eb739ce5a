#include "record_text.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <iterator>
#include <string_view>

namespace {

enum class Value_Kind { any, text, number };

struct Placeholder {
  std::string_view mark;
  Value_Kind kind;
};
constexpr std::array<Placeholder, 3> placeholders = {
    {{"{}", Value_Kind::any}, {"{text}", Value_Kind::text}, {"{number}", Value_Kind::number}}};

bool is_printable(char character) { return character >= ' ' && character <= '~'; }

// Control characters would break the line or the terminal.
void append_escaped(std::string& out, std::string_view text) {
  for (const char character : text) {
    if (is_printable(character)) {
      out += character;
    } else {
      fmt::format_to(std::back_inserter(out), "\\x{:02x}", static_cast<unsigned char>(character));
    }
  }
}

std::string shown_text(const char* text, size_t length) {
  const size_t end = strnlen(text, std::min<size_t>(length, longest_shown_text));
  std::string out;
  append_escaped(out, {text, end});
  if (end == longest_shown_text && length > end && text[end] != '\0') out += "...";
  return out;
}

std::string shown_bytes(const Trace_Data& data) {
  const auto* bytes = static_cast<const uint8_t*>(data.bytes);
  std::string out = "0x";
  for (uint32_t index = 0; index < std::min(data.length, longest_shown_block); ++index) {
    fmt::format_to(std::back_inserter(out), "{:02x}", bytes[index]);
  }
  if (data.length > longest_shown_block) fmt::format_to(std::back_inserter(out), "... ({} bytes)", data.length);
  return out;
}

// Text, perhaps filled up with NULs, and nothing behind it that would be hidden.
bool looks_like_text(const Trace_Data& data) {
  const std::string_view all(static_cast<const char*>(data.bytes), data.length);
  const size_t end = std::min(all.find('\0'), all.size());
  return end > 0 && std::all_of(all.begin(), all.begin() + static_cast<std::ptrdiff_t>(end), is_printable) &&
         all.find_first_not_of('\0', end) == std::string_view::npos;
}

template <typename Integer>
std::string integer_at(const Trace_Data& data) {
  Integer number = 0;
  std::memcpy(&number, data.bytes, sizeof number);
  return fmt::to_string(number);
}

std::string shown_number(const Trace_Data& data) {
  switch (data.length) {
    case sizeof(int16_t):
      return integer_at<int16_t>(data);
    case sizeof(int32_t):
      return integer_at<int32_t>(data);
    case sizeof(int64_t):
      return integer_at<int64_t>(data);
    default:
      return shown_bytes(data);
  }
}

std::string shown(const Trace_Data& data, Value_Kind kind) {
  if (data.bytes == nullptr) return "(null)";
  if (kind == Value_Kind::number) return shown_number(data);
  if (kind == Value_Kind::any && data.length == sizeof(int32_t)) return shown_number(data);
  if (kind == Value_Kind::text || looks_like_text(data)) {
    return shown_text(static_cast<const char*>(data.bytes), data.length);
  }
  return shown_bytes(data);
}

std::string shown(const char* text, Value_Kind) {
  return text == nullptr ? "(null)" : shown_text(text, std::string_view::npos);
}

// Results and error numbers are negative at times, and every other value is below 2^31.
std::string shown(uint32_t value, Value_Kind) { return fmt::to_string(static_cast<int32_t>(value)); }

std::string shown(const Trace_Value& value, Value_Kind kind) {
  return std::visit([kind](const auto& held) { return shown(held, kind); }, value);
}

// Without a text nobody can tell what a number is: both ways of reading it are shown.
std::string shown_without_text(const Trace_Value& value) {
  const auto* number = std::get_if<uint32_t>(&value);
  if (number == nullptr) return shown(value, Value_Kind::any);
  return fmt::format("{} (0x{:x})", static_cast<int32_t>(*number), *number);
}

template <typename Show>
void append_list(std::string& out, std::span<const Trace_Value> values, Show show) {
  const char* separator = ": ";
  for (const Trace_Value& value : values) {
    out += separator + show(value);
    separator = ", ";
  }
}

const Placeholder* placeholder_at(std::string_view text) {
  const auto* found = std::find_if(placeholders.begin(), placeholders.end(),
                                   [text](const Placeholder& each) { return text.starts_with(each.mark); });
  return found == placeholders.end() ? nullptr : found;
}

// Places values into the text and returns those that are left over.
std::span<const Trace_Value> place(std::string& out, std::string_view text, std::span<const Trace_Value> values) {
  while (!text.empty()) {
    const Placeholder* placeholder = placeholder_at(text);
    if (placeholder == nullptr) {
      out += text.front();
      text.remove_prefix(1);
      continue;
    }
    out += values.empty() ? "?" : shown(values.front(), placeholder->kind);
    if (!values.empty()) values = values.subspan(1);
    text.remove_prefix(placeholder->mark.size());
  }
  return values;
}

}  // namespace

std::string record_text(const char* text, std::span<const Trace_Value> values) {
  std::string out;
  if (text == nullptr) {
    out = "record is not in the catalogue";
    append_list(out, values, shown_without_text);
    return out;
  }
  const std::span<const Trace_Value> left = place(out, text, values);
  if (!left.empty()) {
    out += "; further values";
    append_list(out, left, [](const Trace_Value& value) { return shown(value, Value_Kind::any); });
  }
  return out;
}
