#include "platform/Hb_Select.h"

#include <cerrno>

namespace {

// Level of the interface that this source implements; nothing reads it.
[[maybe_unused]] constexpr int Hb_SelectMajorVersion = 1;
[[maybe_unused]] constexpr int Hb_SelectMinorVersion = 0;

int32_t select_error(int system_error) {
  switch (system_error) {
    case EINTR:
      return Hb_Select_CAUGHT_SIGNAL;
    case EBADF:
      return Hb_Select_INVALID_DESCRIPTOR;
    case EAGAIN:
      return Hb_Select_EAGAIN;
    case EFAULT:
      return Hb_Select_INVALID_DATA_POINTER;
    case EINVAL:
      return Hb_Select_INVALID_DATA_VALUE;
    default:
      return Hb_Select_WAIT_ERROR;
  }
}

}  // namespace

Hb_Select::Hb_Select() : myError(Hb_Select_NO_ERROR) { non_blocking_timeout(); }
Hb_Select::~Hb_Select() = default;

int32_t Hb_Select::Error() { return myError; }

Hb_Rc Hb_Select::wait() {
  if (holds_unselectable_descriptor()) {
    myError = Hb_Select_INVALID_DESCRIPTOR;
    return Hb_Failure;
  }
  if (select(FD_SETSIZE, &rd_fds, &wr_fds, &ex_fds, wait_time_ptr) < 0) {
    myError = select_error(errno);
    return Hb_Failure;
  }
  return Hb_Success;
}
