/* System V objects: shared segments and semaphore sets that remove themselves. */
#ifndef HBD_IPC_OBJECTS_H
#define HBD_IPC_OBJECTS_H

#include <sys/types.h>

#include <cstddef>
#include <string>

#include "failure.h"

namespace hbd {

/** The key is in use by somebody else's object. */
class KeyTaken : public Failure {
 public:
  using Failure::Failure;
};

/** The key of an object of the daemon that listens at `path`; the file must be there. */
key_t object_key(const std::string& path, int project);

/** A shared segment, filled with zeros, attached for writing, and removed in the end. */
class SharedSegment {
 public:
  /** @throws KeyTaken when an object has that key, Failure when it cannot be made. */
  SharedSegment(key_t key, std::size_t size, int mode);
  SharedSegment(const SharedSegment&) = delete;
  SharedSegment& operator=(const SharedSegment&) = delete;
  ~SharedSegment();

  [[nodiscard]] void* data() const { return data_; }

 private:
  int id_;
  void* data_;
};

/** A set of semaphores, all 0, removed in the end. */
class SemaphoreSet {
 public:
  /** @throws KeyTaken when an object has that key, Failure when it cannot be made. */
  SemaphoreSet(key_t key, int count, int mode);
  SemaphoreSet(const SemaphoreSet&) = delete;
  SemaphoreSet& operator=(const SemaphoreSet&) = delete;
  ~SemaphoreSet();

  /** Adds to one semaphore; undone should this process die. */
  void add(unsigned short index, short amount) const;
  /** Whether one semaphore is 0 now. */
  [[nodiscard]] bool is_zero(unsigned short index) const;
  /** The process that changed one semaphore last. */
  [[nodiscard]] pid_t last_process(unsigned short index) const;

 private:
  int id_;
};

}  // namespace hbd

#endif
