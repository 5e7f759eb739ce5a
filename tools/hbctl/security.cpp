#include <fmt/format.h>

#include <algorithm>
#include <string_view>

#include "command.h"
#include "daemon_link.h"
#include "security_keys.h"

namespace hbctl {
namespace {

size_t cached_keys(const Hb_Key_Cache& cache) {
  return std::min<size_t>(cache.keyCacheCount, static_cast<size_t>(HB_KEY_CACHE_SIZE));
}

std::string hexadecimal(const sec_key_desc& key) {
  std::string text;
  for (const char c : std::string_view(static_cast<const char*>(key.value), static_cast<size_t>(key.length)))
    text += fmt::format("{:02x}", static_cast<unsigned char>(c));
  return text;
}

const char* yes_or_no(Hb_Boolean value) { return value == Hb_True ? "yes" : "no"; }

Json key_json(const sec_key_desc& key, bool reveal) {
  if (key.length == 0) return nullptr;
  Json json = {{"type", key.type}, {"key_version", key.version}, {"length", key.length}};
  if (reveal) json["value"] = hexadecimal(key);
  return json;
}

Json status_json(const Hb_Security_Status& status, bool reveal) {
  return {{"security_on", status.securityOn == Hb_True},
          {"key_count", status.keyCount},
          {"trell_compatible", status.TRELL_compatible == Hb_True},
          {"signing", status.is_valid_for_signing == Hb_True},
          {"authenticating", status.is_valid_for_authenticating == Hb_True},
          {"key", key_json(status.key, reveal)}};
}

Json security_json(const SecurityKeys& keys, bool reveal) {
  Json json = json_object("security");
  json["sequence"] = keys.sequence();
  json["current"] = status_json(keys.current(), reveal);
  json["previous"] = status_json(keys.previous(), reveal);
  json["cache"] = Json::array();
  for (size_t i = 0; i < cached_keys(keys.cache()); ++i)
    json["cache"].push_back(key_json(keys.cache().keyCache[i], reveal));
  return json;
}

// The columns that every key has.
std::vector<Cell> key_cells(const std::string& which, const sec_key_desc& key) {
  if (key.length == 0) return {{which}, {"-"}, {"-"}, {"none"}};
  return {{which}, {fmt::format("{}", key.type)}, {fmt::format("{}", key.version)}, {fmt::format("{}", key.length)}};
}

class KeyTable {
 public:
  explicit KeyTable(bool reveal) : reveal_(reveal), table_(columns(reveal)) {}

  void add(const std::string& which, const Hb_Security_Status& status) {
    add(which, status.key, yes_or_no(status.is_valid_for_signing), yes_or_no(status.is_valid_for_authenticating));
  }

  void add(const std::string& which, const sec_key_desc& key, const char* signing, const char* authenticating) {
    std::vector<Cell> cells = key_cells(which, key);
    cells.push_back({signing});
    cells.push_back({authenticating});
    if (reveal_) cells.push_back({or_dash(hexadecimal(key))});
    table_.add(cells);
  }

  std::string render(const Style& style) const { return table_.render(style); }

 private:
  static std::vector<Column> columns(bool reveal) {
    std::vector<Column> columns = {
        {"KEY"},     {"TYPE", Align::Right}, {"VERSION", Align::Right}, {"LENGTH", Align::Right},
        {"SIGNING"}, {"AUTHENTICATING"}};
    if (reveal) columns.push_back({"VALUE"});
    return columns;
  }

  bool reveal_;
  Table table_;
};

std::string security_text(const Context& context, const SecurityKeys& keys) {
  KeyTable table(context.options.reveal);
  table.add("current", keys.current());
  table.add("previous", keys.previous());
  for (size_t i = 0; i < cached_keys(keys.cache()); ++i)
    table.add(fmt::format("cached {}", i), keys.cache().keyCache[i], "-", "-");
  return fmt::format("{}  {}\n{}  {}\n", context.style.apply(Paint::Heading, "Security"),
                     keys.current().securityOn == Hb_True ? "on" : "off",
                     context.style.apply(Paint::Heading, "Sequence"), keys.sequence()) +
         table.render(context.style);
}

}  // namespace

void security_command(const Context& context) {
  const DaemonLink link(context.socket_path);
  const SecurityKeys keys;
  context.output.write(context.options.json ? json_document(security_json(keys, context.options.reveal))
                                            : security_text(context, keys));
}

}  // namespace hbctl
