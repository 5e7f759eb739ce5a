#include "support/system_calls.h"

#include <arpa/inet.h>
#include <poll.h>
#include <pthread.h>
#include <sys/ipc.h>
#include <sys/select.h>
#include <sys/sem.h>
#include <sys/shm.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <bit>
#include <cerrno>

namespace hb_test {

namespace {

thread_local SystemCalls* current = nullptr;

constexpr size_t unlimited = SIZE_MAX;

}  // namespace

Outcome pass() { return {true, 0, 0, unlimited, {}}; }
Outcome fail(int error) { return {false, -1, error, unlimited, {}}; }
Outcome result(long value) { return {false, value, 0, unlimited, {}}; }
Outcome limit(size_t bytes) { return {true, 0, 0, bytes, {}}; }
Outcome interrupted(timeval time_left) { return {false, -1, EINTR, unlimited, time_left}; }

SystemCalls::SystemCalls() { current = this; }
SystemCalls::~SystemCalls() { current = nullptr; }

SystemCalls& SystemCalls::script(const std::string& function, std::initializer_list<Outcome> outcomes) {
  std::deque<Outcome>& script = plans_[function].script;
  script.insert(script.end(), outcomes);
  return *this;
}

SystemCalls& SystemCalls::always(const std::string& function, Outcome outcome) {
  plans_[function].always = outcome;
  return *this;
}

SystemCalls& SystemCalls::only(const std::string& function, size_t argument, intptr_t value) {
  plans_[function].only = {argument, value};
  return *this;
}

Outcome SystemCalls::turn(const char* function, SystemCall call) {
  Plan& plan = plans_[function];
  if (plan.only && call.arguments.at(plan.only->first) != plan.only->second) {
    return pass();
  }
  sequence_.emplace_back(function);
  plan.calls.push_back(std::move(call));
  if (plan.script.empty()) {
    return plan.always.value_or(pass());
  }
  const Outcome outcome = plan.script.front();
  plan.script.pop_front();
  return outcome;
}

namespace {

template <typename T>
intptr_t word(T value) {
  if constexpr (std::is_pointer_v<T>) {
    return reinterpret_cast<intptr_t>(value);
  } else {
    return static_cast<intptr_t>(value);
  }
}

// The call is described only where somebody records, so that no memory is taken otherwise.
template <typename Describe>
Outcome turn(const char* function, Describe describe) {
  const int kept = errno;
  const Outcome outcome = current != nullptr ? current->turn(function, describe()) : pass();
  errno = outcome.error != 0 ? outcome.error : kept;
  return outcome;
}

template <typename Result>
Result as(long value) {
  if constexpr (std::is_pointer_v<Result>) {
    return std::bit_cast<Result>(value);
  } else {
    return static_cast<Result>(value);
  }
}

// A function of which nothing but the arguments is recorded.
template <typename Result, typename... Arguments>
Result intercept(const char* function, Result (*real)(Arguments...), Arguments... arguments) {
  const Outcome outcome = turn(function, [&] { return SystemCall{{word(arguments)...}, {}}; });
  return outcome.is_made ? real(arguments...) : as<Result>(outcome.result);
}

std::string copy_of(const void* bytes, size_t size) {
  return bytes != nullptr ? std::string(static_cast<const char*>(bytes), size) : std::string();
}

std::string bytes_of(const iovec* vectors, int count) {
  std::string bytes;
  for (int i = 0; i < count; ++i) {
    bytes += copy_of(vectors[i].iov_base, vectors[i].iov_len);
  }
  return bytes;
}

std::string bytes_of(const fd_set* set) { return set != nullptr ? copy_of(set, 128) : std::string(128, '\0'); }

std::vector<iovec> cut(const iovec* vectors, int count, size_t bytes) {
  std::vector<iovec> kept;
  for (int i = 0; i < count; ++i) {
    const size_t size = std::min(vectors[i].iov_len, bytes);
    kept.push_back({vectors[i].iov_base, size});
    bytes -= size;
  }
  return kept;
}

}  // namespace

}  // namespace hb_test

using namespace hb_test;

// The linker binds calls of a wrapped FUNCTION to __wrap_FUNCTION, and __real_FUNCTION to FUNCTION. In an executable
// that does not wrap it neither is used, hence weak.
#define HB_WRAP_1(result, function, type1)               \
  __attribute__((weak)) result __real_##function(type1); \
  result __wrap_##function(type1 a);                     \
  result __wrap_##function(type1 a) { return intercept(#function, &__real_##function, a); }
#define HB_WRAP_2(result, function, type1, type2)               \
  __attribute__((weak)) result __real_##function(type1, type2); \
  result __wrap_##function(type1 a, type2 b);                   \
  result __wrap_##function(type1 a, type2 b) { return intercept(#function, &__real_##function, a, b); }
#define HB_WRAP_3(result, function, type1, type2, type3)               \
  __attribute__((weak)) result __real_##function(type1, type2, type3); \
  result __wrap_##function(type1 a, type2 b, type3 c);                 \
  result __wrap_##function(type1 a, type2 b, type3 c) { return intercept(#function, &__real_##function, a, b, c); }
#define HB_WRAP_4(result, function, type1, type2, type3, type4)               \
  __attribute__((weak)) result __real_##function(type1, type2, type3, type4); \
  result __wrap_##function(type1 a, type2 b, type3 c, type4 d);               \
  result __wrap_##function(type1 a, type2 b, type3 c, type4 d) {              \
    return intercept(#function, &__real_##function, a, b, c, d);              \
  }

extern "C" {

HB_WRAP_3(int, socket, int, int, int)
HB_WRAP_1(int, close, int)
HB_WRAP_2(key_t, ftok, const char*, int)
HB_WRAP_3(int, shmget, key_t, size_t, int)
HB_WRAP_3(void*, shmat, int, const void*, int)
HB_WRAP_1(int, shmdt, const void*)
HB_WRAP_3(int, semget, key_t, int, int)
HB_WRAP_1(int, pthread_mutexattr_init, pthread_mutexattr_t*)
HB_WRAP_2(int, pthread_mutexattr_settype, pthread_mutexattr_t*, int)
HB_WRAP_1(int, pthread_mutexattr_destroy, pthread_mutexattr_t*)
HB_WRAP_2(int, pthread_mutex_init, pthread_mutex_t*, const pthread_mutexattr_t*)
HB_WRAP_1(int, pthread_mutex_destroy, pthread_mutex_t*)
HB_WRAP_1(int, pthread_mutex_lock, pthread_mutex_t*)
HB_WRAP_1(int, pthread_mutex_unlock, pthread_mutex_t*)
HB_WRAP_4(const char*, inet_ntop, int, const void*, char*, socklen_t)

__attribute__((weak)) int __real_semop(int, sembuf*, size_t);
int __wrap_semop(int set, sembuf* operations, size_t count);
int __wrap_semop(int set, sembuf* operations, size_t count) {
  const Outcome outcome = turn("semop", [&] {
    return SystemCall{{set, word(operations), word(count)}, copy_of(operations, count * sizeof *operations)};
  });
  return outcome.is_made ? __real_semop(set, operations, count) : static_cast<int>(outcome.result);
}

__attribute__((weak)) ssize_t __real_read(int, void*, size_t);
ssize_t __wrap_read(int fd, void* buffer, size_t count);
ssize_t __wrap_read(int fd, void* buffer, size_t count) {
  const Outcome outcome = turn("read", [&] { return SystemCall{{fd, word(buffer), word(count)}, {}}; });
  return outcome.is_made ? __real_read(fd, buffer, std::min(count, outcome.limit)) : outcome.result;
}

__attribute__((weak)) ssize_t __real_write(int, const void*, size_t);
ssize_t __wrap_write(int fd, const void* buffer, size_t count);
ssize_t __wrap_write(int fd, const void* buffer, size_t count) {
  const Outcome outcome = turn("write", [&] {
    return SystemCall{{fd, word(buffer), word(count)}, copy_of(buffer, count)};
  });
  return outcome.is_made ? __real_write(fd, buffer, std::min(count, outcome.limit)) : outcome.result;
}

__attribute__((weak)) ssize_t __real_writev(int, const iovec*, int);
ssize_t __wrap_writev(int fd, const iovec* vectors, int count);
ssize_t __wrap_writev(int fd, const iovec* vectors, int count) {
  const Outcome outcome = turn("writev", [&] {
    return SystemCall{{fd, word(vectors), count}, bytes_of(vectors, count)};
  });
  if (!outcome.is_made) {
    return outcome.result;
  }
  if (outcome.limit == SIZE_MAX) {
    return __real_writev(fd, vectors, count);
  }
  const std::vector<iovec> kept = cut(vectors, count, outcome.limit);
  return __real_writev(fd, kept.data(), count);
}

__attribute__((weak)) int __real_setsockopt(int, int, int, const void*, socklen_t);
int __wrap_setsockopt(int fd, int level, int option, const void* value, socklen_t size);
int __wrap_setsockopt(int fd, int level, int option, const void* value, socklen_t size) {
  const Outcome outcome = turn("setsockopt", [&] {
    return SystemCall{{fd, level, option, word(value), word(size)}, copy_of(value, size)};
  });
  return outcome.is_made ? __real_setsockopt(fd, level, option, value, size) : static_cast<int>(outcome.result);
}

__attribute__((weak)) int __real_connect(int, const sockaddr*, socklen_t);
int __wrap_connect(int fd, const sockaddr* address, socklen_t size);
int __wrap_connect(int fd, const sockaddr* address, socklen_t size) {
  const Outcome outcome = turn("connect", [&] {
    return SystemCall{{fd, word(address), word(size)}, copy_of(address, size)};
  });
  return outcome.is_made ? __real_connect(fd, address, size) : static_cast<int>(outcome.result);
}

__attribute__((weak)) int __real_poll(pollfd*, nfds_t, int);
int __wrap_poll(pollfd* descriptors, nfds_t count, int timeout);
int __wrap_poll(pollfd* descriptors, nfds_t count, int timeout) {
  const Outcome outcome = turn("poll", [&] {
    return SystemCall{{word(descriptors), word(count), timeout, descriptors->fd, descriptors->events}, {}};
  });
  return outcome.is_made ? __real_poll(descriptors, count, timeout) : static_cast<int>(outcome.result);
}

__attribute__((weak)) int __real_select(int, fd_set*, fd_set*, fd_set*, timeval*);
int __wrap_select(int count, fd_set* readable, fd_set* writable, fd_set* exceptional, timeval* timeout);
int __wrap_select(int count, fd_set* readable, fd_set* writable, fd_set* exceptional, timeval* timeout) {
  const Outcome outcome = turn("select", [&] {
    return SystemCall{
        {count, word(readable), word(writable), word(exceptional), word(timeout)},
        bytes_of(readable) + bytes_of(writable) + bytes_of(exceptional) + copy_of(timeout, sizeof(timeval))};
  });
  if (outcome.time_left && timeout != nullptr) {
    *timeout = *outcome.time_left;
  }
  return outcome.is_made ? __real_select(count, readable, writable, exceptional, timeout)
                         : static_cast<int>(outcome.result);
}

}  // extern "C"
