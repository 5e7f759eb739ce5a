#include "support/process_state.h"

#include <dirent.h>

#include <fstream>
#include <stdexcept>
#include <string>

#if defined(__SANITIZE_ADDRESS__)
#define HB_LEAK_SANITIZER 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define HB_LEAK_SANITIZER 1
#endif
#endif

#ifdef HB_LEAK_SANITIZER
#include <sanitizer/lsan_interface.h>
#endif

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

#ifdef HB_LEAK_SANITIZER
LeakAllowed::LeakAllowed() { __lsan_disable(); }
LeakAllowed::~LeakAllowed() { __lsan_enable(); }
#else
LeakAllowed::LeakAllowed() = default;
LeakAllowed::~LeakAllowed() = default;
#endif

}  // namespace hb_test
