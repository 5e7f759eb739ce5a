/* A directory of one test. */
#ifndef HB_TESTS_DAEMON_TEMPORARY_DIRECTORY_H
#define HB_TESTS_DAEMON_TEMPORARY_DIRECTORY_H

#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>

/** Made anew, and removed with what is in it. */
class TemporaryDirectory {
 public:
  TemporaryDirectory() {
    std::string name = "/tmp/hbd_test_XXXXXX";
    if (mkdtemp(name.data()) == nullptr) {
      throw std::runtime_error("mkdtemp failed");
    }
    path_ = name;
  }
  TemporaryDirectory(const TemporaryDirectory&) = delete;
  TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;
  ~TemporaryDirectory() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }

  /** Path of a file in it. */
  [[nodiscard]] std::string path(const std::string& name) const { return path_ + "/" + name; }

  /** Writes a file and returns its path. */
  [[nodiscard]] std::string write(const std::string& name, const std::string& text) const {
    std::ofstream(path(name)) << text;
    return path(name);
  }

 private:
  std::string path_;
};

#endif
