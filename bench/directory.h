// A directory for sockets.
#pragma once

#include <string>

namespace bench {

// A directory under the system's one for temporary files, removed with what is in it.
class Directory {
 public:
  Directory();
  ~Directory();
  Directory(const Directory&) = delete;
  Directory& operator=(const Directory&) = delete;

  const std::string& path() const { return path_; }

 private:
  std::string path_;
};

}  // namespace bench
