#include "utils.h"

#include <climits>
#include <cstdio>
#include <cstring>
#include <new>
#include <string_view>

int memchunks = 0;
char RUNDIR[256] = {};

// The connection layer owns this hook; here it is only called.
void mowl_pin_new_data(void* ptr, size_t sz);

void cpp_malloc(void** p, int size, const char* /*tag*/) {
  if (size == 0) {
    *p = nullptr;
    return;
  }
  // Read back, as compilers take it that no allocator yields null; one that a program has put in its place may.
  char* volatile block = new char[static_cast<size_t>(size)];
  *p = block;
  if (*p != nullptr) {
    ++memchunks;
    mowl_pin_new_data(*p, static_cast<size_t>(size));
  }
}

void ccst_free(void* ptr) {
  delete[] static_cast<char*>(ptr);
  --memchunks;
}

void my_free(void* ptr) { ccst_free(ptr); }

namespace {

char* allocate(size_t size, const char* tag) {
  if (size > INT_MAX) {
    throw std::bad_alloc();
  }
  void* block = nullptr;
  cpp_malloc(&block, static_cast<int>(size), tag);
  return static_cast<char*>(block);
}

char* copy_with_tag(const char* s, const char* tag) {
  const size_t size = std::strlen(s) + 1;
  char* copy = allocate(size, tag);
  std::memcpy(copy, s, size);
  return copy;
}

}  // namespace

char* copy_string(const char* s) { return copy_with_tag(s, "copy_string"); }

char* remove_last_word(char* str, char c) {
  size_t end = std::strlen(str);
  if (end > 0) {
    --end;  // a separator in the very last position does not count
  }
  while (end > 0 && str[end - 1] != c) {
    --end;
  }
  str[end] = '\0';
  return str;
}

char* remove_first_word(char* str, char c) {
  const char* separator = std::strchr(str, c);
  if (c == '\0' || separator == nullptr) {
    str[0] = '\0';
    return str;
  }
  char* rest = copy_with_tag(separator + 1, "remove_first_word");
  std::memcpy(str, rest, std::strlen(rest) + 1);
  ccst_free(rest);
  return str;
}

char* make_2_strings(char* a, char* b) {
  const size_t size_a = std::strlen(a) + 1;
  const size_t size_b = std::strlen(b) + 1;
  char* buffer = allocate(size_a + size_b, "make_2_strings");
  std::memcpy(buffer, a, size_a);
  std::memcpy(buffer + size_a, b, size_b);
  return buffer;
}

int get_2_strings(char* buffer, char** a, char** b) {
  *a = copy_with_tag(buffer, "get_2_strings");
  *b = copy_with_tag(buffer + std::strlen(buffer) + 1, "get_2_strings");
  return 0;
}

void syntax_error(char* what) { std::fprintf(stderr, "\n******************** %s: syntax error *******\n\n", what); }

std::string convert_usr_sbin_qarn_path_to_opt_qarn_path(const char* path) {
  static constexpr std::string_view old_directory = "/usr/sbin/qarn/";
  if (path == nullptr) {
    return {};
  }
  const std::string_view text = path;
  if (!text.starts_with(old_directory)) {
    return std::string(text);
  }
  return std::string("/opt/qarn/").append(text.substr(old_directory.size()));
}
