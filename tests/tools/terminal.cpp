#include "terminal.h"

#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>
#include <system_error>

namespace hb_test {
namespace {

constexpr int kPatienceMs = 10000;

}  // namespace

Terminal::Terminal() {
  if (openpty(&person_side_, &command_side_, nullptr, nullptr, nullptr) != 0)
    throw std::system_error(errno, std::generic_category(), "openpty");
  for (const int descriptor : {person_side_, command_side_}) fcntl(descriptor, F_SETFD, FD_CLOEXEC);
}

Terminal::~Terminal() {
  close(person_side_);
  close(command_side_);
}

std::string Terminal::read_to(const std::string& text) {
  std::string screen;
  while (screen.find(text) == std::string::npos) {
    pollfd entry{person_side_, POLLIN, 0};
    char character = 0;
    if (poll(&entry, 1, kPatienceMs) <= 0 || read(person_side_, &character, 1) != 1)
      throw std::runtime_error("the screen does not show " + text + ", but: " + screen);
    screen += character;
  }
  return screen;
}

std::string Terminal::read_written() {
  std::string screen;
  pollfd entry{person_side_, POLLIN, 0};
  while (poll(&entry, 1, 0) > 0) {
    char buffer[4096];
    const ssize_t count = read(person_side_, buffer, sizeof buffer);
    if (count <= 0) break;
    screen.append(buffer, static_cast<size_t>(count));
  }
  return screen;
}

void Terminal::type(const std::string& keys) {
  if (write(person_side_, keys.data(), keys.size()) != static_cast<ssize_t>(keys.size()))
    throw std::system_error(errno, std::generic_category(), "write to a terminal");
}

}  // namespace hb_test
