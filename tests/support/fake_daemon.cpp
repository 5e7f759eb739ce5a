#include "support/fake_daemon.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <initializer_list>
#include <stdexcept>
#include <system_error>
#include <utility>
#include <vector>

namespace hb_test {

namespace {

constexpr int patience_ms = 10000;

[[noreturn]] void throw_errno(const std::string& what) {
  throw std::system_error(errno, std::generic_category(), what);
}

// Whether the first of the descriptors became readable.
bool readable_within(std::initializer_list<int> descriptors, int milliseconds) {
  std::vector<pollfd> requests;
  for (const int descriptor : descriptors) {
    requests.push_back({descriptor, POLLIN, 0});
  }
  int ready = 0;
  do {
    ready = ::poll(requests.data(), requests.size(), milliseconds);
  } while (ready < 0 && errno == EINTR);
  return ready > 0 && requests[0].revents != 0;
}

void await_readable(int descriptor, const StopSignal& stop, const char* what) {
  if (!readable_within({descriptor, stop.descriptor()}, patience_ms)) {
    throw std::runtime_error(std::string("waited in vain for ") + what);
  }
}

}  // namespace

StopSignal::StopSignal() : descriptor_(::eventfd(0, EFD_CLOEXEC)) {
  if (descriptor_ < 0) {
    throw_errno("eventfd");
  }
}

StopSignal::~StopSignal() { ::close(descriptor_); }

// An event counter that was made takes a first event.
void StopSignal::raise() noexcept { ::eventfd_write(descriptor_, 1); }

DaemonConnection::DaemonConnection(DaemonConnection&& other) noexcept
    : descriptor_(std::exchange(other.descriptor_, -1)), stop_(std::move(other.stop_)) {}

DaemonConnection& DaemonConnection::operator=(DaemonConnection&& other) noexcept {
  if (this != &other) {
    close();
    descriptor_ = std::exchange(other.descriptor_, -1);
    stop_ = std::move(other.stop_);
  }
  return *this;
}

// Bytes of the stream, fewer than asked only at its end.
Bytes DaemonConnection::receive_up_to(size_t count) {
  Bytes bytes;
  while (bytes.size() < count) {
    await_readable(descriptor_, *stop_, "bytes of a client");
    char buffer[65536];
    const ssize_t n = ::recv(descriptor_, buffer, std::min(count - bytes.size(), sizeof buffer), 0);
    if (n < 0 && errno == EINTR) {
      continue;
    }
    if (n < 0 && errno != ECONNRESET) {
      throw_errno("recv");
    }
    if (n <= 0) {
      break;
    }
    bytes.append(buffer, static_cast<size_t>(n));
  }
  return bytes;
}

Bytes DaemonConnection::receive_raw(size_t count) {
  Bytes bytes = receive_up_to(count);
  if (bytes.size() < count) {
    throw std::runtime_error("the client closed the connection");
  }
  return bytes;
}

Bytes DaemonConnection::receive_request() { return receive_raw(u32_at(receive_raw(4), 0)); }

bool DaemonConnection::has_input() const { return readable_within({descriptor_}, 0); }

bool DaemonConnection::at_end() { return receive_up_to(1).empty(); }

void DaemonConnection::send_raw(std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t n = ::send(descriptor_, bytes.data(), bytes.size(), MSG_NOSIGNAL);
    if (n < 0 && errno == EINTR) {
      continue;
    }
    if (n < 0) {
      throw_errno("send");
    }
    bytes.remove_prefix(static_cast<size_t>(n));
  }
}

void DaemonConnection::send_byte_by_byte(std::string_view bytes) {
  for (size_t i = 0; i < bytes.size(); ++i) {
    send_raw(bytes.substr(i, 1));
  }
}

void DaemonConnection::close() {
  if (descriptor_ >= 0) {
    ::close(std::exchange(descriptor_, -1));
  }
}

Publication Publication::none() {
  Publication publication;
  publication.configuration_segment = false;
  publication.route_segment = false;
  publication.security_segment = false;
  publication.semaphores = false;
  return publication;
}

Publication Publication::for_nodes(uint32_t count) {
  Publication publication;
  publication.nodes = count;
  publication.route_size = size_t{count} * 184;
  return publication;
}

FakeDaemon::FakeDaemon(const Publication& publication) : publication_(publication) {
  listen_and_publish();
  setenv("HB_SERVER_SOCKET", path_.c_str(), 1);
  unsetenv("HA_DOMAIN_NAME");
  unsetenv("HA_SYSPAR_NAME");
}

FakeDaemon::~FakeDaemon() {
  stop_->raise();  // a script may still wait for a client or for bytes
  if (thread_.joinable()) {
    thread_.join();
  }
  withdraw();
  ::close(listener_);
}

// Keys are made of few bits of the socket's file: where another test has the same, another file is taken.
void FakeDaemon::listen_and_publish() {
  for (int attempt = 0; attempt < 50; ++attempt) {
    if (listen_at("socket" + std::to_string(attempt)) && publish()) {
      return;
    }
    withdraw();
    ::close(listener_);
  }
  throw std::runtime_error("no socket file with free keys");
}

bool FakeDaemon::listen_at(const std::string& name) {
  path_ = directory_.path(name);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  path_.copy(address.sun_path, sizeof address.sun_path - 1);
  listener_ = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (listener_ < 0 || ::bind(listener_, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0 ||
      ::listen(listener_, 8) != 0) {
    throw_errno("listening at " + path_);
  }
  return true;
}

bool FakeDaemon::publish() {
  const bool is_published =
      publish_segment(Segment::configuration, 103, publication_.configuration_segment,
                      publication_.configuration_size) &&
      publish_segment(Segment::route, 104, publication_.route_segment, publication_.route_size) &&
      publish_segment(Segment::security, 112, publication_.security_segment, publication_.security_size) &&
      publish_semaphores();
  if (is_published && publication_.configuration_segment) {
    fill_configuration_segment();
  }
  return is_published;
}

bool FakeDaemon::publish_segment(Segment segment, int project, bool wanted, size_t size) {
  const key_t key = ::ftok(path_.c_str(), project);
  if (!wanted) {
    return ::shmget(key, 0, 0) < 0 && errno == ENOENT;
  }
  const int id = ::shmget(key, size, IPC_CREAT | IPC_EXCL | publication_.permissions);
  if (id < 0 && errno != EEXIST) {
    throw_errno("shmget");
  }
  segment_ids_[static_cast<size_t>(segment)] = id;
  return id >= 0;
}

bool FakeDaemon::publish_semaphores() {
  const key_t key = ::ftok(path_.c_str(), 105);
  if (!publication_.semaphores) {
    return ::semget(key, 0, 0) < 0 && errno == ENOENT;
  }
  semaphore_id_ = ::semget(key, publication_.semaphore_count, IPC_CREAT | IPC_EXCL | publication_.permissions);
  if (semaphore_id_ < 0 && errno != EEXIST) {
    throw_errno("semget");
  }
  return semaphore_id_ >= 0;
}

void FakeDaemon::fill_configuration_segment() {
  const Bytes words =
      ByteBuilder().u32(publication_.sequence_number).u32(publication_.nodes).u32(publication_.adapters).bytes();
  write_segment(Segment::configuration, 0, words.substr(0, publication_.configuration_size));
}

void FakeDaemon::withdraw() {
  for (const Segment segment : {Segment::configuration, Segment::route, Segment::security}) {
    remove_segment(segment);
  }
  remove_semaphores();
}

DaemonConnection FakeDaemon::accept() {
  await_readable(listener_, *stop_, "a client");
  const int descriptor = ::accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
  if (descriptor < 0) {
    throw_errno("accept");
  }
  return DaemonConnection(descriptor, stop_);
}

bool FakeDaemon::has_client() const { return readable_within({listener_}, 0); }

void FakeDaemon::run(std::function<void(FakeDaemon&)> script) {
  join();
  thread_ = std::thread([this, script = std::move(script)] {
    try {
      script(*this);
    } catch (...) {
      failure_ = std::current_exception();
    }
  });
}

void FakeDaemon::join() {
  if (thread_.joinable()) {
    thread_.join();
  }
  if (failure_) {
    std::rethrow_exception(std::exchange(failure_, nullptr));
  }
}

void FakeDaemon::serve_configuration(const Bytes& answer) {
  run([answer](FakeDaemon& daemon) {
    DaemonConnection connection = daemon.accept();
    const Bytes request = connection.receive_request();
    if (i32_at(request, 8) != 201) {
      throw std::runtime_error("the client did not ask for the configuration");
    }
    connection.send_frame(answer);
    daemon.served_ = std::move(connection);
  });
}

DaemonConnection FakeDaemon::take_connection() {
  join();
  return std::move(served_);
}

void FakeDaemon::stop_listening() { ::shutdown(listener_, SHUT_RDWR); }

void FakeDaemon::write_segment(Segment segment, size_t offset, std::string_view bytes) {
  void* memory = ::shmat(segment_id(segment), nullptr, 0);
  if (reinterpret_cast<intptr_t>(memory) == -1) {
    throw_errno("shmat");
  }
  std::memcpy(static_cast<char*>(memory) + offset, bytes.data(), bytes.size());
  ::shmdt(memory);
}

Bytes FakeDaemon::read_segment(Segment segment) {
  shmid_ds state{};
  void* memory = ::shmat(segment_id(segment), nullptr, SHM_RDONLY);
  if (reinterpret_cast<intptr_t>(memory) == -1 || ::shmctl(segment_id(segment), IPC_STAT, &state) != 0) {
    throw_errno("shmat");
  }
  Bytes bytes(static_cast<const char*>(memory), state.shm_segsz);
  ::shmdt(memory);
  return bytes;
}

void FakeDaemon::remove_segment(Segment segment) {
  int& id = segment_ids_[static_cast<size_t>(segment)];
  if (id >= 0) {
    ::shmctl(std::exchange(id, -1), IPC_RMID, nullptr);
  }
}

void FakeDaemon::remove_semaphores() {
  if (semaphore_id_ >= 0) {
    ::semctl(std::exchange(semaphore_id_, -1), 0, IPC_RMID);
  }
}

int FakeDaemon::attachments(Segment segment) const {
  shmid_ds state{};
  if (::shmctl(segment_id(segment), IPC_STAT, &state) != 0) {
    throw_errno("shmctl");
  }
  return static_cast<int>(state.shm_nattch);
}

}  // namespace hb_test
