// A client and nothing else: starts, takes one event, and prints its resident memory in kilobytes before, between and
// after.
#include <cstdio>
#include <fstream>
#include <memory>
#include <string>

#include "hb_client.h"

namespace {

long resident_kilobytes() {
  std::ifstream status("/proc/self/status");
  for (std::string word; status >> word;) {
    if (word == "VmRSS:") {
      long kilobytes = 0;
      status >> kilobytes;
      return kilobytes;
    }
  }
  return 0;
}

bool take_event() {
  auto group = std::make_unique<Hb_Group>();
  int* descriptors = nullptr;
  int count = 0;
  Hb_Events events = 0;
  Hb_Name name;
  Hb_Seq_Num number = 0;
  timeval limit{10, 0};
  return hb_get_file_descriptor_array(&descriptors, &count) == Hb_Success &&
         hb_get_event_message(descriptors, &limit, &events, name, group.get(), &number) == Hb_Success &&
         hb_free_file_descriptor_array(descriptors) == Hb_Success;
}

}  // namespace

int main() {
  const long before = resident_kilobytes();
  if (hb_init() != Hb_Success) return 1;
  const long loaded = resident_kilobytes();
  if (!take_event()) return 1;
  std::printf("%ld %ld %ld\n", before, loaded, resident_kilobytes());
  hb_terminate();
  return 0;
}
