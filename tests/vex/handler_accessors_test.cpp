// The accessors of handlers are functions of the library, found by their names. No header of theirs is read here.
#include <gtest/gtest.h>

extern "C" {
extern const char hb_get_file_descriptor __asm__("_ZN12EVMONHandler17getFileDescriptorEv") __attribute__((weak));
extern const char hb_get_open_file_error __asm__("_ZN12EVMONHandler16getOpenFileErrorEv") __attribute__((weak));
extern const char hb_get_open_rc __asm__("_ZN12EVMONHandler28getVEXEVMOpenRCInConstructorEv") __attribute__((weak));
extern const char hb_get_event_write_fd __asm__("_ZN21EVMONEventPipeHandler10getWriteFdEv") __attribute__((weak));
extern const char hb_get_group_write_fd __asm__("_ZN25EVMONNewGroupEventHandler10getWriteFdEv") __attribute__((weak));
// Brings the handlers into the program.
int hb_initialize_evmon_event_handlers(void);
}

namespace hb_test {
namespace {

TEST(HandlerAccessors, AreDefinedByTheLibrary) {
  EXPECT_NE(&hb_initialize_evmon_event_handlers, nullptr);
  EXPECT_NE(&hb_get_file_descriptor, nullptr);
  EXPECT_NE(&hb_get_open_file_error, nullptr);
  EXPECT_NE(&hb_get_open_rc, nullptr);
  EXPECT_NE(&hb_get_event_write_fd, nullptr);
  EXPECT_NE(&hb_get_group_write_fd, nullptr);
}

}  // namespace
}  // namespace hb_test
