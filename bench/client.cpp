#include "client.h"

#include <cstdlib>
#include <stdexcept>
#include <string>
#include <thread>

namespace bench {

void point_library_at(const std::string& socket_path) {
  setenv("HB_SERVER_SOCKET", socket_path.c_str(), 1);
  unsetenv("HA_DOMAIN_NAME");
  unsetenv("HA_SYSPAR_NAME");
}

void require(Hb_Rc result, const char* what) {
  if (result == Hb_Success) return;
  throw std::runtime_error(std::string(what) + " failed with error number " + std::to_string(hb_get_errno()));
}

Client::Client(const Peer& peer) {
  point_library_at(peer.socket_path());
  std::jthread daemon([&] { daemon_end_ = peer.accept_and_answer(); });
  require(hb_init(), "hb_init");
  daemon.join();
  int count = 0;
  require(hb_get_file_descriptor_array(&descriptors_, &count), "hb_get_file_descriptor_array");
}

Client::~Client() {
  hb_free_file_descriptor_array(descriptors_);
  hb_terminate();
}

}  // namespace bench
