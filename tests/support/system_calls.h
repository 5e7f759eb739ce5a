// Recording and scripting system functions. A test executable names them in WRAP of hb_test(); a call of one of them
// that is made while a SystemCalls of the same thread lives is recorded and may be made to fail on purpose.
#pragma once

#include <sys/time.h>

#include <cstdint>
#include <deque>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace hb_test {

// What happens at one call.
struct Outcome {
  bool is_made;                      // whether the real function is called
  long result;                       // else what the call yields,
  int error;                         // and its errno, 0 to leave it alone
  size_t limit;                      // of a call that is made: most bytes that read, write and writev move
  std::optional<timeval> time_left;  // of select: what it leaves in the time-out
};

// The call is made.
Outcome pass();
// The call is not made and yields -1 with that errno.
Outcome fail(int error);
// The call is not made and yields that value. (For functions that return their error number.)
Outcome result(long value);
// The call is made with at most so many bytes.
Outcome limit(size_t bytes);
// select is not made and yields -1 and EINTR, with so much of its time left.
Outcome interrupted(timeval time_left);

// One call that was made of a wrapped function.
struct SystemCall {
  std::vector<intptr_t> arguments;
  // writev and write: the bytes given. setsockopt: the value. connect: the address. semop: the operations, 6 bytes
  // each. select: 128 bytes of each set (zeros for a null set), then 16 of the time-out (none for a null one).
  std::string bytes;
};

class SystemCalls {
 public:
  SystemCalls();
  ~SystemCalls();
  SystemCalls(const SystemCalls&) = delete;
  SystemCalls& operator=(const SystemCalls&) = delete;

  // The outcomes of the next calls, in order; later ones are made.
  SystemCalls& script(const std::string& function, std::initializer_list<Outcome> outcomes);
  // The outcome of every call behind the script.
  SystemCalls& always(const std::string& function, Outcome outcome);
  // Only calls whose argument has that value are recorded and scripted.
  SystemCalls& only(const std::string& function, size_t argument, intptr_t value);
  SystemCalls& only(const std::string& function, size_t argument, const void* value) {
    return only(function, argument, reinterpret_cast<intptr_t>(value));
  }

  // The calls of one function, in order.
  const std::vector<SystemCall>& of(const std::string& function) { return plans_[function].calls; }
  // The names of all functions called, in order.
  const std::vector<std::string>& sequence() const { return sequence_; }

  // For the wrappers: records the call and says what happens at it.
  Outcome turn(const char* function, SystemCall call);

 private:
  struct Plan {
    std::deque<Outcome> script;
    std::optional<Outcome> always;
    std::optional<std::pair<size_t, intptr_t>> only;
    std::vector<SystemCall> calls;
  };

  std::map<std::string, Plan> plans_;
  std::vector<std::string> sequence_;
};

}  // namespace hb_test
