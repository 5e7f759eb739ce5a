/* Where the daemon listens. */
#ifndef HBD_SOCKET_PATH_H
#define HBD_SOCKET_PATH_H

#include <string>

namespace hbd {

/** The path that clients with the same environment resolve. */
std::string socket_path_from_environment();

/** Refuses a path that is empty or too long for a socket address. */
void check_socket_path(const std::string& path);

}  // namespace hbd

#endif
