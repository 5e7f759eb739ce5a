#include "daemon_link.h"

#include "errors.h"
#include "hb_client.h"

namespace hbctl {

DaemonLink::DaemonLink(const std::string& socket_path) {
  if (hb_init() != Hb_Success) throw start_error(socket_path);
}

DaemonLink::~DaemonLink() { hb_terminate(); }

}  // namespace hbctl
