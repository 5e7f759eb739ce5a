#include "Hb_Select_Base.h"

namespace {

// Level of the interface that this source implements; nothing reads it.
[[maybe_unused]] constexpr int Hb_SelectMajorVersion = 1;
[[maybe_unused]] constexpr int Hb_SelectMinorVersion = 0;

constexpr timeval default_wait_time = {10, 0};

bool is_selectable(int fd) { return fd >= 0 && fd < FD_SETSIZE; }

// The three families of operations differ only in the fields that they work on.
struct Family {
  fd_set& set;
  fd_set*& set_ptr;
  int32_t& count;
  int32_t& unselectable;

  void zero() {
    count = 0;
    unselectable = 0;
    set_ptr = nullptr;
    FD_ZERO(&set);
  }

  void add(int fd) {
    ++count;
    set_ptr = &set;
    if (is_selectable(fd)) {
      FD_SET(fd, &set);
    } else {
      ++unselectable;
    }
  }

  void clear(int fd) {
    --count;
    if (count == 0) {
      set_ptr = nullptr;
    }
    if (is_selectable(fd)) {
      FD_CLR(fd, &set);
    } else if (unselectable > 0) {
      --unselectable;
    }
  }
};

int is_set(int fd, const fd_set& set) { return is_selectable(fd) && FD_ISSET(fd, &set) ? 1 : 0; }

}  // namespace

Hb_Select_Base::Hb_Select_Base() : myError(0), wait_time(default_wait_time), wait_time_ptr(&wait_time) {
  Hb_Select_Base::rd_zero();
  Hb_Select_Base::wr_zero();
  Hb_Select_Base::ex_zero();
}

Hb_Select_Base::~Hb_Select_Base() = default;

int32_t Hb_Select_Base::Error() { return myError; }

void Hb_Select_Base::rd_zero() { Family{rd_fds, rd_fds_ptr, rd_count, rd_unselectable}.zero(); }
void Hb_Select_Base::rd_clr(int fd) { Family{rd_fds, rd_fds_ptr, rd_count, rd_unselectable}.clear(fd); }
void Hb_Select_Base::rd_set(int fd) { Family{rd_fds, rd_fds_ptr, rd_count, rd_unselectable}.add(fd); }
int Hb_Select_Base::rd_isset(int fd) const { return is_set(fd, rd_fds); }

void Hb_Select_Base::wr_zero() { Family{wr_fds, wr_fds_ptr, wr_count, wr_unselectable}.zero(); }
void Hb_Select_Base::wr_clr(int fd) { Family{wr_fds, wr_fds_ptr, wr_count, wr_unselectable}.clear(fd); }
void Hb_Select_Base::wr_set(int fd) { Family{wr_fds, wr_fds_ptr, wr_count, wr_unselectable}.add(fd); }
int Hb_Select_Base::wr_isset(int fd) const { return is_set(fd, wr_fds); }

void Hb_Select_Base::ex_zero() { Family{ex_fds, ex_fds_ptr, ex_count, ex_unselectable}.zero(); }
void Hb_Select_Base::ex_clr(int fd) { Family{ex_fds, ex_fds_ptr, ex_count, ex_unselectable}.clear(fd); }
void Hb_Select_Base::ex_set(int fd) { Family{ex_fds, ex_fds_ptr, ex_count, ex_unselectable}.add(fd); }
int Hb_Select_Base::ex_isset(int fd) const { return is_set(fd, ex_fds); }

void Hb_Select_Base::non_blocking_timeout() { timeout({0, 0}); }

void Hb_Select_Base::timeout(const timeval& time) {
  wait_time = time;
  wait_time_ptr = &wait_time;
}

void Hb_Select_Base::blocking_timeout() { wait_time_ptr = nullptr; }

bool Hb_Select_Base::holds_unselectable_descriptor() const {
  return rd_unselectable > 0 || wr_unselectable > 0 || ex_unselectable > 0;
}
