// Assertions: say what failed and where, then abort.
#include "zu_cu.h"

#include <cstdio>
#include <cstdlib>

namespace {
const char* known(const char* text) { return text == nullptr ? "(unknown)" : text; }
}  // namespace

void __zu_assert(const char* text, const char* file, int line) {
  std::fprintf(stderr, "assertion failed: %s, file %s, line %d\n", known(text), known(file), line);
  std::abort();
}
