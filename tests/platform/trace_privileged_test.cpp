// A program that runs with more rights than its caller: the environment yields nothing to those who ask with care.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>

#include "child_process.h"
#include "support/temporary_directory.h"
#include "trace_component.h"

extern "C" char* secure_getenv(const char*) noexcept { return nullptr; }

namespace {

TEST(TraceOfAPrivilegedProgram, IsNotSwitchedOnByTheEnvironment) {
  const TemporaryDirectory directory;
  const std::string path = directory.path("trace");
  const Child_Result child = run_in_child([&] {
    set_trace(("file:" + path).c_str(), "debug");
    ASSERT_NE(std::getenv("ZU_TRACE"), nullptr);
    Trace_Component component;
    EXPECT_EQ(component.register_it(), 0);
    EXPECT_THAT(component.levels, testing::Each(0));
  });
  EXPECT_EQ(child.exit_status, 0);
  EXPECT_EQ(child.errors, "");
  EXPECT_THAT(lines_of_file(path), testing::IsEmpty());
}

}  // namespace
