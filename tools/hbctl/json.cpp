#include "json.h"

#include "error_catalogue.h"

namespace hbctl {
namespace {

// Names come from outside: bytes that are not UTF-8 are replaced.
std::string dump(const Json& json, int indent) {
  return json.dump(indent, ' ', false, Json::error_handler_t::replace) + '\n';
}

}  // namespace

Json json_object(const char* type) { return {{"version", kJsonVersion}, {"type", type}}; }

Json error_json(const CommandError& error) {
  const std::string text = error.what();
  const size_t end = text.find('\n');
  Json json = {{"exit_status", static_cast<int>(error.status())}};
  json["name"] = error.number() != 0 ? Json(error_name(error.number())) : Json(nullptr);
  json["number"] = error.number() != 0 ? Json(error.number()) : Json(nullptr);
  json["message"] = text.substr(0, end);
  json["advice"] = end != std::string::npos ? Json(text.substr(end + 1)) : Json(nullptr);
  return json;
}

std::string json_document(const Json& json) { return dump(json, 2); }

std::string json_line(const Json& json) { return dump(json, -1); }

}  // namespace hbctl
