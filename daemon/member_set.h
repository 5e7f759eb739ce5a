/* Sets of adapter, node or site numbers, in the bit order of subscriptions. */
#ifndef HBD_MEMBER_SET_H
#define HBD_MEMBER_SET_H

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace hbd {

/** A set of numbers: number i is the bit 7 - i % 8 of byte i / 8, the most significant bit first. */
class MemberSet {
 public:
  MemberSet() = default;
  /** An empty set with room for numbers below `limit`. */
  explicit MemberSet(std::size_t limit) : bytes_((limit + 7) / 8) {}
  /** The set that the bytes hold. */
  explicit MemberSet(std::span<const std::uint8_t> bytes) : bytes_(bytes.begin(), bytes.end()) {}

  [[nodiscard]] bool contains(std::size_t number) const {
    return number / 8 < bytes_.size() && (bytes_[number / 8] & bit(number)) != 0;
  }

  /** Puts a number in; it must be below the limit. */
  void add(std::size_t number) { bytes_[number / 8] |= bit(number); }
  /** Takes a number out; it must be below the limit. */
  void remove(std::size_t number) { bytes_[number / 8] &= static_cast<std::uint8_t>(~bit(number)); }

  [[nodiscard]] bool overlaps(const MemberSet& other) const {
    const std::size_t common = std::min(bytes_.size(), other.bytes_.size());
    for (std::size_t i = 0; i < common; ++i) {
      if ((bytes_[i] & other.bytes_[i]) != 0) {
        return true;
      }
    }
    return false;
  }

  /** The lowest number in the set. */
  [[nodiscard]] std::optional<std::size_t> first() const {
    for (std::size_t i = 0; i < bytes_.size(); ++i) {
      if (bytes_[i] != 0) {
        return i * 8 + static_cast<std::size_t>(std::countl_zero(bytes_[i]));
      }
    }
    return std::nullopt;
  }

  /** Calls `visit` with each number, ascending. */
  template <typename Visit>
  void for_each(Visit visit) const {
    for (std::size_t i = 0; i < bytes_.size(); ++i) {
      for (std::uint8_t rest = bytes_[i]; rest != 0;) {
        const auto offset = static_cast<std::size_t>(std::countl_zero(rest));
        rest &= static_cast<std::uint8_t>(~bit(offset));
        visit(i * 8 + offset);
      }
    }
  }

 private:
  static constexpr std::uint8_t bit(std::size_t number) { return static_cast<std::uint8_t>(0x80U >> (number % 8)); }

  std::vector<std::uint8_t> bytes_;
};

}  // namespace hbd

#endif
