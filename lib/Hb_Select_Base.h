// A wrapper of select: three descriptor sets, a time-out and an error code.
#pragma once

#include <sys/select.h>

#include <cstdint>

#include "hb_client/types.h"

class Hb_Select_Base {
 public:
  Hb_Select_Base();
  virtual ~Hb_Select_Base();
  Hb_Select_Base(const Hb_Select_Base&) = delete;
  Hb_Select_Base& operator=(const Hb_Select_Base&) = delete;

  virtual int32_t Error();

  virtual void rd_zero();
  virtual void rd_clr(int fd);
  virtual void rd_set(int fd);
  virtual int rd_isset(int fd) const;

  virtual void wr_zero();
  virtual void wr_clr(int fd);
  virtual void wr_set(int fd);
  virtual int wr_isset(int fd) const;

  virtual void ex_zero();
  virtual void ex_clr(int fd);
  virtual void ex_set(int fd);
  virtual int ex_isset(int fd) const;

  virtual Hb_Rc wait() = 0;

  void non_blocking_timeout();
  void timeout(const timeval& time);
  void blocking_timeout();  // wait without limit

 protected:
  // Descriptors outside the sets are counted: while there is one, a wait has to fail.
  bool holds_unselectable_descriptor() const;

  int32_t myError;
  fd_set rd_fds;
  fd_set wr_fds;
  fd_set ex_fds;
  fd_set* rd_fds_ptr;  // the set while its count is not zero, else null
  fd_set* wr_fds_ptr;
  fd_set* ex_fds_ptr;
  int32_t rd_count;  // set calls minus clear calls since the last zero
  int32_t wr_count;
  int32_t ex_count;
  timeval wait_time;
  timeval* wait_time_ptr;  // null: wait without limit

 private:
  int32_t rd_unselectable;
  int32_t wr_unselectable;
  int32_t ex_unselectable;
};
