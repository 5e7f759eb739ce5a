#include "trace_settings.h"

#include <fmt/format.h>
#include <strings.h>

#include <algorithm>
#include <array>
#include <cstring>

namespace {

constexpr std::string_view file_prefix = "file:";

struct Detail_Word {
  std::string_view word;
  uint32_t highest_default_level;
};
constexpr std::array<Detail_Word, 3> detail_words = {{{"errors", 0}, {"info", 1}, {"debug", 2}}};
constexpr const char* default_detail = "info";

bool is_set(const char* value) { return value != nullptr && *value != '\0'; }

bool same_name(std::string_view first, std::string_view second) {
  return first.size() == second.size() && strncasecmp(first.data(), second.data(), first.size()) == 0;
}

std::string_view name_of(const tr_category& category) {
  return category.category_name == nullptr ? std::string_view() : category.category_name;
}

std::vector<bool> up_to_level(uint32_t highest, std::span<const tr_category> categories) {
  std::vector<bool> wanted;
  for (const tr_category& category : categories) wanted.push_back(category.default_level_of_detail <= highest);
  return wanted;
}

[[noreturn]] void refuse_detail(const char* value) {
  throw Trace_Setting_Error(fmt::format(
      "{} is \"{}\", which is none of errors, info, debug, and no list of category names separated by commas",
      trace_detail_variable, value));
}

std::vector<std::string_view> split_at_commas(std::string_view list) {
  std::vector<std::string_view> names;
  for (size_t comma = list.find(','); comma != std::string_view::npos; comma = list.find(',')) {
    names.push_back(list.substr(0, comma));
    list.remove_prefix(comma + 1);
  }
  names.push_back(list);
  return names;
}

std::vector<bool> named_categories(const char* value, std::span<const tr_category> categories) {
  std::vector<bool> wanted(categories.size(), false);
  for (const std::string_view name : split_at_commas(value)) {
    const auto found = std::find_if(categories.begin(), categories.end(),
                                    [name](const tr_category& each) { return same_name(name_of(each), name); });
    if (name.empty() || found == categories.end()) refuse_detail(value);
    wanted[static_cast<size_t>(found - categories.begin())] = true;
  }
  return wanted;
}

}  // namespace

Trace_Place parse_trace_place(const char* value) {
  if (!is_set(value)) return {};
  const std::string_view text = value;
  if (text == "stderr") return {Trace_Destination::standard_error, {}};
  if (text == "syslog") return {Trace_Destination::system_log, {}};
  if (text.starts_with(file_prefix) && text.size() > file_prefix.size()) {
    return {Trace_Destination::file, std::string(text.substr(file_prefix.size()))};
  }
  throw Trace_Setting_Error(
      fmt::format("{} is \"{}\", which is none of stderr, syslog, file:PATH", trace_variable, value));
}

std::vector<bool> parse_trace_detail(const char* value, std::span<const tr_category> categories) {
  const char* detail = is_set(value) ? value : default_detail;
  for (const Detail_Word& each : detail_words) {
    if (same_name(each.word, detail)) return up_to_level(each.highest_default_level, categories);
  }
  return named_categories(detail, categories);
}
