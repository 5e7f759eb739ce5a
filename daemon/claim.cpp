#include "claim.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <spdlog/spdlog.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <utility>
#include <vector>

#include "failure.h"
#include "hb_protocol/framing.h"
#include "stale_objects.h"

namespace hbd {
namespace {

constexpr mode_t directory_mode = 0755;
constexpr mode_t socket_mode = 0660;
constexpr int backlog = 1024;
constexpr int most_attempts = 32;

Failure failure(std::string_view what, const std::string& path, std::string_view advice) {
  return Failure(fmt::format("{} {} failed: {}; {}", what, path, std::strerror(errno), advice));
}

std::filesystem::path directory_of(const std::string& path) {
  const auto parent = std::filesystem::path(path).parent_path();
  return parent.empty() ? "." : parent;
}

void make_directories(const std::filesystem::path& directory) {
  if (directory.empty() || std::filesystem::exists(directory)) {
    return;
  }
  make_directories(directory.parent_path());
  if (mkdir(directory.c_str(), directory_mode) != 0 && errno != EEXIST) {
    throw failure("making the directory", directory, "give another path with --socket, or run as a user who may");
  }
}

/* While it is open no other daemon starts in the same directory. The system lets go of it when this process ends. */
Descriptor lock_directory(const std::filesystem::path& directory) {
  Descriptor lock(open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!lock.valid() || flock(lock.get(), LOCK_EX) != 0) {
    throw failure("locking the directory", directory, "give another path with --socket, or run as a user who may");
  }
  return lock;
}

sockaddr_un address_of(const std::string& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  path.copy(address.sun_path, sizeof(address.sun_path) - 1);
  return address;
}

Descriptor new_socket() {
  Descriptor socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
  if (!socket.valid()) {
    throw Failure(fmt::format("making a socket failed: {}", std::strerror(errno)));
  }
  return socket;
}

bool is_refused_by_nobody(const std::string& path) {
  const Descriptor socket = new_socket();
  const sockaddr_un address = address_of(path);
  /* A full backlog yields EAGAIN: somebody listens. */
  return connect(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof(address)) != 0 &&
         errno == ECONNREFUSED;
}

void clear_stale(const std::string& path) {
  struct stat file {};
  if (lstat(path.c_str(), &file) != 0) {
    return;
  }
  if (!S_ISSOCK(file.st_mode)) {
    throw Failure(fmt::format("{} is there and is no socket; remove it, or give another path with --socket", path));
  }
  if (!is_refused_by_nobody(path)) {
    throw Failure(fmt::format("a daemon listens at {} already; stop it, or give another path with --socket", path));
  }
  remove_stale_objects(path);
  if (unlink(path.c_str()) != 0) {
    throw failure("removing the stale socket file", path, "remove it, or give another path with --socket");
  }
  spdlog::info("removed the socket file {} that was left behind", path);
}

/* Socket files that had to make way: they keep their inodes from being used again until one that suits is found. */
class SetAside {
 public:
  SetAside() = default;
  SetAside(const SetAside&) = delete;
  SetAside& operator=(const SetAside&) = delete;
  ~SetAside() {
    for (const auto& name : names_) {
      unlink(name.c_str());
    }
  }
  void take(const std::string& path) {
    const std::string name = fmt::format("{}.{}.{}", path, getpid(), names_.size());
    if (std::rename(path.c_str(), name.c_str()) != 0) {
      throw failure("renaming", path, "give another path with --socket");
    }
    names_.push_back(name);
  }
  [[nodiscard]] std::size_t size() const { return names_.size(); }

 private:
  std::vector<std::string> names_;
};

}  // namespace

SocketFile::SocketFile(std::string path) : path_(std::move(path)) {
  struct stat file {};
  if (lstat(path_.c_str(), &file) == 0) {
    device_ = file.st_dev;
    inode_ = file.st_ino;
  }
}

SocketFile::~SocketFile() {
  struct stat file {};
  if (lstat(path_.c_str(), &file) == 0 && file.st_dev == device_ && file.st_ino == inode_) {
    unlink(path_.c_str());
  }
}

Claim::Claim(Loop& loop, const std::string& path, const Publication& publication, std::chrono::milliseconds patience)
    : path_(path), patience_(patience) {
  const auto directory = directory_of(path);
  make_directories(directory);
  const Descriptor lock = lock_directory(directory);
  clear_stale(path);
  bind_and_publish(loop, publication);
  if (listen(socket_.get(), backlog) != 0) {
    throw failure("listening at", path, "give another path with --socket");
  }
}

/* Keys hold 16 bits of the inode only: when others use them, another socket file has other ones. */
void Claim::bind_and_publish(Loop& loop, const Publication& publication) {
  SetAside set_aside;
  for (;;) {
    bind_socket();
    remove_stale_objects(path_);
    try {
      publisher_ = std::make_unique<Publisher>(loop, path_, publication, patience_);
      return;
    } catch (const KeyTaken& taken) {
      spdlog::debug("{}", taken.what());
      if (set_aside.size() == most_attempts) {
        throw;
      }
    }
    set_aside.take(path_);
  }
}

void Claim::bind_socket() {
  socket_ = new_socket();
  const sockaddr_un address = address_of(path_);
  if (bind(socket_.get(), reinterpret_cast<const sockaddr*>(&address), sizeof(address)) != 0) {
    throw failure("making the socket file", path_, "give another path with --socket, or run as a user who may");
  }
  file_ = std::make_unique<SocketFile>(path_);
  chmod(path_.c_str(), socket_mode);
}

}  // namespace hbd
