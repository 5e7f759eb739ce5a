#include <gtest/gtest.h>

#include "zu_cu.h"

namespace {

TEST(AssertionDeathTest, TellsTextFileAndLineAndAborts) {
  EXPECT_EXIT(__zu_assert("pthread_mutex_lock(&a_mutex) == 0", "lib/hb_global_data", 321),
              testing::KilledBySignal(SIGABRT),
              "^assertion failed: pthread_mutex_lock\\(&a_mutex\\) == 0, file lib/hb_global_data, line 321\n$");
}

TEST(AssertionDeathTest, WithoutTextAndFileStillTellsTheLine) {
  EXPECT_EXIT(__zu_assert(nullptr, nullptr, 5), testing::KilledBySignal(SIGABRT),
              "^assertion failed: \\(unknown\\), file \\(unknown\\), line 5\n$");
}

}  // namespace
