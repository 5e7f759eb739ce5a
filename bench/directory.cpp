#include "directory.h"

#include <cstdlib>
#include <filesystem>
#include <system_error>

#include "descriptor.h"

namespace bench {

Directory::Directory() {
  // mkdtemp() puts a name of its own in the place of the six letters.
  std::string name = (std::filesystem::temp_directory_path() / "hb_bench.XXXXXX").string();
  if (mkdtemp(name.data()) == nullptr) throw_errno("mkdtemp " + name);
  path_ = name;
}

Directory::~Directory() {
  std::error_code ignored;
  std::filesystem::remove_all(path_, ignored);
}

}  // namespace bench
