#include "style.h"

#include <unistd.h>

#include <cstdlib>

namespace hbctl {
namespace {

std::string_view escape_of(Paint paint) {
  switch (paint) {
    case Paint::Heading:
      return "\033[1m";
    case Paint::Good:
      return "\033[32m";
    case Paint::Bad:
      return "\033[31m";
    case Paint::Doubtful:
      return "\033[33m";
    case Paint::Notice:
      return "\033[36m";
    case Paint::Plain:
      break;
  }
  return "";
}

std::string_view environment(const char* name) {
  const char* value = std::getenv(name);
  return value != nullptr ? value : "";
}

}  // namespace

std::string Style::apply(Paint paint, std::string_view text) const {
  const std::string_view escape = escape_of(paint);
  if (!coloured_ || escape.empty() || text.empty()) return std::string(text);
  return std::string(escape).append(text).append("\033[0m");
}

bool wants_colour(std::string_view when, int fd) {
  if (when == "always") return true;
  if (when == "never" || !environment("NO_COLOR").empty()) return false;
  return isatty(fd) == 1 && environment("TERM") != "dumb";
}

}  // namespace hbctl
