// The outputs of hb_get_event_message, filled with a pattern so that a test sees every byte that was written.
#pragma once

#include <cstdint>
#include <cstring>
#include <memory>
#include <string>

#include "hb_client.h"
#include "support/bytes.h"

namespace hb_test {

// An event record as bytes. Offsets: type 0, cursor 4, events 8, status 12, failure-data identifier 16 (43 bytes),
// membership 60. Of an adapter group: count 60, leader 64, incarnation 68, list 72. Of a node group: count 60, list 64.
class GroupBytes {
 public:
  explicit GroupBytes(const Hb_Group& group) : bytes_(reinterpret_cast<const char*>(&group), sizeof group) {}

  GroupBytes& put(size_t offset, const Bytes& field) {
    bytes_.replace(offset, field.size(), field);
    return *this;
  }
  GroupBytes& u32(size_t offset, uint32_t value) { return put(offset, ByteBuilder().u32(value).bytes()); }
  GroupBytes& i32(size_t offset, int32_t value) { return put(offset, ByteBuilder().i32(value).bytes()); }

  GroupBytes& type(int32_t value) { return i32(0, value); }
  GroupBytes& events(int32_t value) { return i32(8, value); }
  GroupBytes& status(int32_t value) { return i32(12, value); }
  GroupBytes& no_ffdc() { return put(16, Bytes(43, '\0')); }

  bool is(const Hb_Group& group) const { return std::memcmp(bytes_.data(), &group, sizeof group) == 0; }

 private:
  Bytes bytes_;
};

struct EventOutputs {
  EventOutputs() {
    std::memset(group.get(), 0x5A, sizeof *group);
    std::memset(name, 'x', sizeof name);
  }

  bool untouched() const {
    return events == 0x7A && sequence == 0x7B && Bytes(name, sizeof name) == Bytes(sizeof name, 'x') &&
           Bytes(reinterpret_cast<const char*>(group.get()), sizeof *group) == Bytes(sizeof *group, 0x5A);
  }

  Hb_Events events = 0x7A;
  Hb_Seq_Num sequence = 0x7B;
  char name[40];
  std::unique_ptr<Hb_Group> group = std::make_unique<Hb_Group>();
};

}  // namespace hb_test
