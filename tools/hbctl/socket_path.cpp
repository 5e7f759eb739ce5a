#include "socket_path.h"

#include <cstdlib>

namespace hbctl {
namespace {

constexpr const char* kDefaultPath = "/var/ha/soc/mowl/server_socket";
constexpr const char* kPathVariable = "HB_SERVER_SOCKET";
// The first one that is not empty is appended after a dot.
constexpr const char* kSuffixVariables[] = {"HA_DOMAIN_NAME", "HA_SYSPAR_NAME"};

}  // namespace

std::string socket_path_from_environment() {
  const char* base = std::getenv(kPathVariable);
  std::string path = base != nullptr ? base : kDefaultPath;
  for (const char* variable : kSuffixVariables) {
    const char* suffix = std::getenv(variable);
    if (suffix != nullptr && *suffix != '\0') return path + '.' + suffix;
  }
  return path;
}

void use_socket_path(const std::string& path) {
  setenv(kPathVariable, path.c_str(), 1);
  for (const char* variable : kSuffixVariables) unsetenv(variable);
}

}  // namespace hbctl
