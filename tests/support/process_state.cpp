#include "support/process_state.h"

#include <dirent.h>

#include <fstream>
#include <stdexcept>
#include <string>

// Of the leak sanitizer, where the executable is built with it.
extern "C" {
__attribute__((weak)) void __lsan_disable();
__attribute__((weak)) void __lsan_enable();
}

namespace hb_test {

namespace {

int entries_of(const char* directory) {
  DIR* entries = opendir(directory);
  if (entries == nullptr) {
    throw std::runtime_error(std::string("cannot list ") + directory);
  }
  int count = 0;
  while (const dirent* entry = readdir(entries)) {
    count += entry->d_name[0] != '.' ? 1 : 0;
  }
  closedir(entries);
  return count;
}

}  // namespace

// The descriptor that lists the directory is one of its entries.
int open_descriptors() { return entries_of("/proc/self/fd") - 1; }

int running_threads() { return entries_of("/proc/self/task"); }

int attached_segments() {
  std::ifstream maps("/proc/self/maps");
  int count = 0;
  for (std::string line; std::getline(maps, line);) {
    count += line.find("/SYSV") != std::string::npos ? 1 : 0;
  }
  return count;
}

LeakAllowed::LeakAllowed() {
  if (__lsan_disable != nullptr) {
    __lsan_disable();
  }
}

LeakAllowed::~LeakAllowed() {
  if (__lsan_enable != nullptr) {
    __lsan_enable();
  }
}

}  // namespace hb_test
