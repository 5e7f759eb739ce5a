/* Why the daemon cannot start or go on. */
#ifndef HBD_FAILURE_H
#define HBD_FAILURE_H

#include <stdexcept>

namespace hbd {

/** Ends the daemon with a message for people: what failed, on what, and what to do next. */
class Failure : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

}  // namespace hbd

#endif
