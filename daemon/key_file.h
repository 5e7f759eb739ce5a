/* A security key in a file. */
#ifndef HBD_KEY_FILE_H
#define HBD_KEY_FILE_H

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>

namespace hbd {

/**
 * Reads a file whose bytes are a key into `value`, and yields how many they are.
 *
 * @throws Failure when the file is another user's, when anybody but its user has a right to it, or when it holds no
 * byte or more than `value` has room for.
 */
std::size_t read_key_file(const std::string& file, std::span<std::uint8_t> value);

}  // namespace hbd

#endif
