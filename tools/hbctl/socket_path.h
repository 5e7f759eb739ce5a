// Where the library looks for the daemon.
#pragma once

#include <string>

namespace hbctl {

// The path that the library will connect to, from the same environment variables.
std::string socket_path_from_environment();

// Makes the library connect to exactly this path, whatever the environment says.
void use_socket_path(const std::string& path);

}  // namespace hbctl
