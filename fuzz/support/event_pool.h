// Records of VEX-mode events that were allocated and not released yet.
#pragma once

#include <cstddef>

namespace fuzz {

size_t events_in_use();

}  // namespace fuzz
