// A directory of one test, for sockets and files.
#pragma once

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <system_error>

// Made anew, and removed with what is in it. Its name is short, as a socket's path has to be.
class TemporaryDirectory {
 public:
  TemporaryDirectory() {
    // mkdtemp() puts a name of its own in the place of the six letters.
    std::string name = "/tmp/hb_test.XXXXXX";
    if (mkdtemp(name.data()) == nullptr) {
      throw std::system_error(errno, std::generic_category(), "making the directory " + name);
    }
    path_ = name;
  }
  TemporaryDirectory(const TemporaryDirectory&) = delete;
  TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;
  ~TemporaryDirectory() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }

  [[nodiscard]] const std::string& path() const { return path_; }

  // Path of a file in it.
  [[nodiscard]] std::string path(const std::string& name) const { return path_ + "/" + name; }

  // Writes a file and returns its path.
  [[nodiscard]] std::string write(const std::string& name, const std::string& text) const {
    std::ofstream(path(name)) << text;
    return path(name);
  }

 private:
  std::string path_;
};
