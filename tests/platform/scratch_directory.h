// A directory of the test's own, removed with everything in it at the end.
#pragma once

#include <string>
#include <vector>

class Scratch_Directory {
 public:
  Scratch_Directory();
  ~Scratch_Directory();
  Scratch_Directory(const Scratch_Directory&) = delete;
  Scratch_Directory& operator=(const Scratch_Directory&) = delete;

  std::string path(const std::string& name) const { return directory_ + "/" + name; }

 private:
  std::string directory_;
};

void write_file(const std::string& path, const std::string& content);
std::vector<std::string> lines_of_file(const std::string& path);
