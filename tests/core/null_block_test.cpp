// An array allocator of the program's own that yields null where it should throw.
#include <gtest/gtest.h>

#include <cstdlib>

#include "utils.h"

namespace {

bool yields_null = false;

}  // namespace

void* operator new[](size_t size) {
  void* block = yields_null ? nullptr : std::malloc(size);
  return block;
}
void operator delete[](void* block) noexcept { std::free(block); }
void operator delete[](void* block, size_t) noexcept { std::free(block); }

namespace hb_test {
namespace {

TEST(NullBlock, IsStoredAndNotCounted) {
  const int before = memchunks;
  int something = 0;
  void* block = &something;
  yields_null = true;
  cpp_malloc(&block, 8, "tag");
  yields_null = false;
  EXPECT_EQ(block, nullptr);
  EXPECT_EQ(memchunks, before);
}

}  // namespace
}  // namespace hb_test
