#include "key_file.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "descriptor.h"
#include "failure.h"

namespace hbd {
namespace {

constexpr mode_t rights_of_others = S_IRWXG | S_IRWXO;

Failure failure(const std::string& file, const std::string& reason, const std::string& advice) {
  return Failure(fmt::format("the key file {} {}; {}", file, reason, advice));
}

void check(const std::string& file, const struct stat& state, std::size_t room) {
  if (!S_ISREG(state.st_mode)) {
    throw failure(file, "is no regular file", "give another one with --key-file");
  }
  if (state.st_uid != geteuid()) {
    throw failure(file, fmt::format("belongs to user {}", state.st_uid), "give it to the daemon's user with chown");
  }
  if ((state.st_mode & rights_of_others) != 0) {
    throw failure(file, fmt::format("is open to group or others (mode {:04o})", state.st_mode & 07777U),
                  "make a new key, as this one may be known, and protect it with chmod 600");
  }
  if (state.st_size < 1 || static_cast<std::size_t>(state.st_size) > room) {
    throw failure(file, fmt::format("has {} bytes", state.st_size), fmt::format("a key has 1 to {}", room));
  }
}

}  // namespace

std::size_t read_key_file(const std::string& file, std::span<std::uint8_t> value) {
  const Descriptor opened(open(file.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
  struct stat state {};
  if (!opened.valid() || fstat(opened.get(), &state) != 0) {
    throw failure(file, fmt::format("cannot be opened: {}", std::strerror(errno)),
                  "make it, readable by the daemon's user alone, or leave --key-file out");
  }
  check(file, state, value.size());
  const ssize_t size = read(opened.get(), value.data(), value.size());
  if (size < 1) {
    throw failure(file, fmt::format("cannot be read: {}", size == 0 ? "it is empty now" : std::strerror(errno)),
                  "try again");
  }
  return static_cast<std::size_t>(size);
}

}  // namespace hbd
