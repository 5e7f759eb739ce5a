#include <fmt/format.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "hb_client/route.h"
#include "request.h"
#include "text.h"

namespace hbctl {
namespace {

// No more than the library could refuse for its size.
std::string read_standard_input() {
  std::string text(HB_ROUTED_MESSAGE_SIZE + 1, '\0');
  size_t size = 0;
  while (size < text.size()) {
    const ssize_t count = read(STDIN_FILENO, text.data() + size, text.size() - size);
    if (count == 0) break;
    if (count > 0) {
      size += static_cast<size_t>(count);
    } else if (errno != EINTR) {
      throw CommandError(ExitStatus::Failed, std::string("cannot read standard input: ") + std::strerror(errno));
    }
  }
  text.resize(size);
  return text;
}

Hb_Rc send_message(std::string& text, int port, std::vector<int> nodes) {
  iovec buffer{text.data(), text.size()};
  return hb_daemon_route_mcast(&buffer, text.empty() ? 0 : 1, port, nodes.data(), static_cast<int>(nodes.size()));
}

std::string describe(const std::vector<int>& nodes, int port, size_t size) {
  return fmt::format("send {} to port {} of {} {}", count_of(static_cast<int64_t>(size), "byte"), port,
                     nodes.size() == 1 ? "node" : "nodes", number_ranges({nodes.begin(), nodes.end()}));
}

}  // namespace

void send_command(const Context& context) {
  const Options& options = context.options;
  const std::vector<int> nodes(options.selection.nodes.begin(), options.selection.nodes.end());
  std::string text = options.text == "-" ? read_standard_input() : options.text;
  const Request request = {"send",
                           describe(nodes, options.port, text.size()),
                           Outcome::Sent,
                           "",
                           "name each node once",
                           {{"nodes", nodes}, {"port", options.port}, {"bytes", text.size()}}};
  carry_out(context, request, [&] { return send_message(text, options.port, nodes); });
}

}  // namespace hbctl
