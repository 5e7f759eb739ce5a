#include "scratch_directory.h"

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <system_error>

Scratch_Directory::Scratch_Directory() {
  std::string name = (std::filesystem::temp_directory_path() / "trace-test-XXXXXX").string();
  if (mkdtemp(name.data()) == nullptr) throw std::system_error(errno, std::generic_category(), name);
  directory_ = name;
}

Scratch_Directory::~Scratch_Directory() {
  std::error_code ignored;
  std::filesystem::remove_all(directory_, ignored);
}

void write_file(const std::string& path, const std::string& content) { std::ofstream(path) << content; }

std::vector<std::string> lines_of_file(const std::string& path) {
  std::ifstream file(path);
  std::vector<std::string> lines;
  for (std::string line; std::getline(file, line);) lines.push_back(line);
  return lines;
}
