#include "toml_table.h"

#include <fmt/format.h>
#include <fmt/ranges.h>

#include <algorithm>

#include "address.h"
#include "duration.h"

namespace hbd {

unsigned line_of(const toml::node& node) { return static_cast<unsigned>(node.source().begin.line); }

const toml::node* TomlTable::find(std::string_view key) {
  asked_.emplace_back(key);
  return table_->get(key);
}

const toml::node& TomlTable::get(std::string_view key) {
  const toml::node* node = find(key);
  if (node == nullptr) {
    throw ScenarioMistake{line(), fmt::format("{} has no \"{}\"; add it", title_, key)};
  }
  return *node;
}

unsigned TomlTable::line(std::string_view key) const {
  const toml::node* node = table_->get(key);
  return node == nullptr ? line() : line_of(*node);
}

void TomlTable::refuse(std::string_view key, const std::string& complaint) const {
  throw ScenarioMistake{line(key), fmt::format("{} \"{}\" {}", title_, key, complaint)};
}

std::string TomlTable::text(std::string_view key, std::size_t longest) {
  const auto text = get(key).value_exact<std::string>();
  if (!text || text->empty() || text->size() > longest) {
    refuse(key, fmt::format("must be a text of 1 to {} characters", longest));
  }
  if (text->find('\0') != std::string::npos) {
    refuse(key, "must not contain a NUL character");
  }
  return *text;
}

std::string TomlTable::text(std::string_view key, std::size_t longest, std::string otherwise) {
  return find(key) == nullptr ? std::move(otherwise) : text(key, longest);
}

std::int64_t TomlTable::number(std::string_view key, std::int64_t least, std::int64_t most) {
  const auto number = get(key).value_exact<std::int64_t>();
  if (!number || *number < least || *number > most) {
    refuse(key, fmt::format("must be a whole number from {} to {}", least, most));
  }
  return *number;
}

std::int64_t TomlTable::number(std::string_view key, std::int64_t least, std::int64_t most, std::int64_t otherwise) {
  return find(key) == nullptr ? otherwise : number(key, least, most);
}

bool TomlTable::truth(std::string_view key, bool otherwise) {
  const toml::node* node = find(key);
  if (node == nullptr) {
    return otherwise;
  }
  const auto truth = node->value_exact<bool>();
  if (!truth) {
    refuse(key, "must be true or false");
  }
  return *truth;
}

std::chrono::microseconds TomlTable::duration(std::string_view key) {
  const auto text = get(key).value_exact<std::string>();
  const auto duration = text ? parse_duration(*text) : std::nullopt;
  if (!duration) {
    refuse(key, R"(must be a length of time in quotes, as "250ms", "1.5s" or "2m")");
  }
  return *duration;
}

std::chrono::microseconds TomlTable::duration(std::string_view key, std::chrono::microseconds otherwise) {
  return find(key) == nullptr ? otherwise : duration(key);
}

Hb_IP_address6 TomlTable::address(std::string_view key) {
  const auto text = get(key).value_exact<std::string>();
  const auto address = text ? parse_address(*text) : std::nullopt;
  if (!address) {
    refuse(key, R"(must be an IPv4 or IPv6 address in quotes, as "192.0.2.1" or "2001:db8::1")");
  }
  return *address;
}

TomlTable TomlTable::table(std::string_view key, const std::string& title) {
  static const toml::table empty;
  const toml::node* node = find(key);
  if (node != nullptr && !node->is_table()) {
    refuse(key, "must be a table");
  }
  return {node == nullptr ? empty : *node->as_table(), title};
}

std::vector<TomlTable> TomlTable::tables(std::string_view key, const std::string& title) {
  std::vector<TomlTable> tables;
  const toml::node* node = find(key);
  if (node == nullptr) {
    return tables;
  }
  const toml::array* array = node->as_array();
  if (array == nullptr) {
    refuse(key, "must be an array of tables");
  }
  for (const toml::node& each : *array) {
    if (!each.is_table()) {
      throw ScenarioMistake{line_of(each), fmt::format("{} \"{}\" must hold tables only", title_, key)};
    }
    tables.emplace_back(*each.as_table(), title);
  }
  return tables;
}

std::vector<std::pair<std::string, unsigned>> TomlTable::texts(std::string_view key) {
  std::vector<std::pair<std::string, unsigned>> texts;
  const toml::node* node = find(key);
  if (node == nullptr) {
    return texts;
  }
  const toml::array* array = node->as_array();
  if (array == nullptr) {
    refuse(key, "must be an array of texts");
  }
  for (const toml::node& each : *array) {
    const auto text = each.value_exact<std::string>();
    if (!text) {
      throw ScenarioMistake{line_of(each), fmt::format("{} \"{}\" must hold texts only", title_, key)};
    }
    texts.emplace_back(*text, line_of(each));
  }
  return texts;
}

void TomlTable::finish() const {
  for (const auto& [key, node] : *table_) {
    if (std::find(asked_.begin(), asked_.end(), key.str()) == asked_.end()) {
      std::vector<std::string> known = asked_;
      std::sort(known.begin(), known.end());
      known.erase(std::unique(known.begin(), known.end()), known.end());
      throw ScenarioMistake{line_of(node), fmt::format("{} has an unknown key \"{}\"; the keys are: {}", title_,
                                                       key.str(), fmt::join(known, ", "))};
    }
  }
}

}  // namespace hbd
