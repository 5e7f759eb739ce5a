/* One table of a scenario, read key by key with errors that say where and what to do. */
#ifndef HBD_TOML_TABLE_H
#define HBD_TOML_TABLE_H

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <toml++/toml.h>

#include "hb_client/types.h"

namespace hbd {

/** A mistake in the text, thrown by the readers. */
struct ScenarioMistake {
  unsigned line;
  std::string text;
};

/** Line of a node of the text. */
unsigned line_of(const toml::node& node);

/** Reads the keys of one table; those that nobody asked for are refused in the end. */
class TomlTable {
 public:
  /** @param title how messages call the table, for example "[cluster]". */
  TomlTable(const toml::table& table, std::string title) : table_(&table), title_(std::move(title)) {}

  [[nodiscard]] bool has(std::string_view key) const { return table_->contains(key); }
  /** Line of the table. */
  [[nodiscard]] unsigned line() const { return line_of(*table_); }
  /** Line of a key's value, or of the table when the key is not there. */
  [[nodiscard]] unsigned line(std::string_view key) const;
  [[nodiscard]] const std::string& title() const { return title_; }

  /** A text of one to `longest` characters. */
  std::string text(std::string_view key, std::size_t longest);
  std::string text(std::string_view key, std::size_t longest, std::string otherwise);
  /** A whole number within bounds. */
  std::int64_t number(std::string_view key, std::int64_t least, std::int64_t most);
  std::int64_t number(std::string_view key, std::int64_t least, std::int64_t most, std::int64_t otherwise);
  bool truth(std::string_view key, bool otherwise);
  std::chrono::microseconds duration(std::string_view key);
  std::chrono::microseconds duration(std::string_view key, std::chrono::microseconds otherwise);
  Hb_IP_address6 address(std::string_view key);
  /** The table of a key; an empty one when the key is not there. */
  TomlTable table(std::string_view key, const std::string& title);
  /** The tables of an array; none when the key is not there. */
  std::vector<TomlTable> tables(std::string_view key, const std::string& title);
  /** The texts of an array, each with its line; none when the key is not there. */
  std::vector<std::pair<std::string, unsigned>> texts(std::string_view key);

  /** Refuses keys that were not asked for. */
  void finish() const;

  /** Refuses the value of a key. */
  [[noreturn]] void refuse(std::string_view key, const std::string& complaint) const;

 private:
  const toml::node* find(std::string_view key);
  const toml::node& get(std::string_view key);

  const toml::table* table_;
  std::string title_;
  std::vector<std::string> asked_;
};

}  // namespace hbd

#endif
