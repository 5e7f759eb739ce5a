#include "socket_path.h"

#include <fmt/format.h>

#include <cstdlib>
#include <string_view>

#include "failure.h"
#include "hb_protocol/framing.h"

namespace hbd {

std::string socket_path_from_environment() {
  const char* replaced = std::getenv(HB_SERVER_SOCKET_VARIABLE);
  const std::string_view base = replaced != nullptr ? replaced : HB_DEFAULT_SERVER_SOCKET;
  for (const char* variable : {HB_DOMAIN_VARIABLE, HB_PARTITION_VARIABLE}) {
    const char* suffix = std::getenv(variable);
    if (suffix != nullptr && *suffix != '\0') {
      return fmt::format("{}.{}", base, suffix);
    }
  }
  return std::string(base);
}

void check_socket_path(const std::string& path) {
  if (path.empty()) {
    throw Failure(
        fmt::format("the socket path is empty; give one with --socket, or unset {}", HB_SERVER_SOCKET_VARIABLE));
  }
  if (path.size() >= HB_SOCKET_PATH_SIZE) {
    throw Failure(fmt::format("the socket path {} has {} characters; {} are the most, give a shorter one with --socket",
                              path, path.size(), HB_SOCKET_PATH_SIZE - 1));
  }
}

}  // namespace hbd
