// The program: options, the command, and how it ends.
#pragma once

namespace hbctl {

int run(int argc, const char* const* argv);

}  // namespace hbctl
