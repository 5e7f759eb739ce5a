#include "segments.h"

#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <cstdint>

#include "descriptor.h"
#include "hb_protocol/shared_memory.h"

namespace bench {
namespace {

key_t key_of(const std::string& socket_path, int project) {
  const key_t key = ftok(socket_path.c_str(), project);
  if (key == -1) throw_errno("ftok " + socket_path);
  return key;
}

}  // namespace

Segments* Segments::present_ = nullptr;

Segments::Segments(const std::string& socket_path, const Cluster& cluster)
    : socket_path_(socket_path), directory_(socket_path.substr(0, socket_path.rfind('/'))) {
  present_ = this;
  try {
    publish(socket_path, cluster);
  } catch (...) {
    remove();
    throw;
  }
}

Segments::~Segments() { remove(); }

void Segments::publish(const std::string& socket_path, const Cluster& cluster) {
  const auto nodes = static_cast<uint32_t>(cluster.nodes);
  const int first = make_segment(socket_path, HB_CONFIGURATION_SEGMENT_ID, sizeof(memory_configuration_data));
  make_segment(socket_path, HB_ROUTE_SEGMENT_ID, nodes * sizeof(route_sequence));
  make_segment(socket_path, HB_SECURITY_SEGMENT_ID, sizeof(security_information));
  make_semaphores(socket_path);
  void* attached = shmat(first, nullptr, 0);
  if (reinterpret_cast<intptr_t>(attached) == -1) throw_errno("shmat");
  *static_cast<memory_configuration_data*>(attached) = {1, nodes, static_cast<uint32_t>(cluster.adapters())};
  shmdt(attached);
}

int Segments::make_segment(const std::string& socket_path, int project, size_t size) {
  const int segment = shmget(key_of(socket_path, project), size, IPC_CREAT | IPC_EXCL | 0600);
  if (segment < 0) throw_errno("shmget");
  segments_.push_back(segment);
  return segment;
}

void Segments::make_semaphores(const std::string& socket_path) {
  semaphores_ = semget(key_of(socket_path, HB_SEMAPHORE_SET_ID), HB_SEMAPHORE_COUNT, IPC_CREAT | IPC_EXCL | 0600);
  if (semaphores_ < 0) throw_errno("semget");
  std::array<unsigned short, HB_SEMAPHORE_COUNT> zeros{};
  union {
    int value;
    unsigned short* values;
  } argument{.values = zeros.data()};
  if (semctl(semaphores_, 0, SETALL, argument) != 0) throw_errno("semctl");
}

void Segments::remove() {
  present_ = nullptr;
  for (const int segment : segments_) shmctl(segment, IPC_RMID, nullptr);
  if (semaphores_ >= 0) semctl(semaphores_, 0, IPC_RMID);
}

void Segments::remove_and_exit(int signal) {
  if (Segments* present = present_; present != nullptr) {
    present->remove();
    unlink(present->socket_path_.c_str());
    rmdir(present->directory_.c_str());
  }
  _exit(128 + signal);
}

void clear_up_on_signals() {
  for (const int signal : {SIGINT, SIGTERM, SIGHUP}) std::signal(signal, Segments::remove_and_exit);
}

}  // namespace bench
