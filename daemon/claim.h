/* Taking hold of a socket path, with everything whose key depends on it. */
#ifndef HBD_CLAIM_H
#define HBD_CLAIM_H

#include <sys/types.h>

#include <memory>
#include <string>

#include "descriptor.h"
#include "loop.h"
#include "publisher.h"

namespace hbd {

/** A socket file, removed in the end if it is still the same one. */
class SocketFile {
 public:
  /** Notes which file is at the path now. */
  explicit SocketFile(std::string path);
  SocketFile(const SocketFile&) = delete;
  SocketFile& operator=(const SocketFile&) = delete;
  ~SocketFile();

 private:
  std::string path_;
  dev_t device_ = 0;
  ino_t inode_ = 0;
};

/** A socket path that is ours: the socket listens and the segments are published, until the end. */
class Claim {
 public:
  /**
   * Clears what a killed daemon left, and refuses to start beside a live one.
   *
   * @param patience see Publisher.
   * @throws Failure when the path cannot be had.
   */
  Claim(Loop& loop, const std::string& path, const Publication& publication, std::chrono::milliseconds patience);
  Claim(const Claim&) = delete;
  Claim& operator=(const Claim&) = delete;
  ~Claim() = default;

  [[nodiscard]] int listening() const { return socket_.get(); }
  Publisher& publisher() { return *publisher_; }

 private:
  void bind_and_publish(Loop& loop, const Publication& publication);
  void bind_socket();

  std::string path_;
  std::chrono::milliseconds patience_;
  Descriptor socket_;
  std::unique_ptr<SocketFile> file_;
  std::unique_ptr<Publisher> publisher_;
};

}  // namespace hbd

#endif
