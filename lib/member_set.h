// The members of a subscription group: a count, and a set of bits with the most significant bit of each byte first.
// Count and set lie at the same place whatever the members are, so one view serves all kinds.
#pragma once

#include <algorithm>
#include <cstring>

#include "hb_client/subscription.h"

class Member_Set {
 public:
  explicit Member_Set(Hb_Subscription_Group* group)
      : members_(group->Hb_subscription_grp_union.Hb_adapter_subscription_grp) {}

  int32_t count() const { return members_.Hb_num_adapters; }
  void set_count(int32_t count) { members_.Hb_num_adapters = count; }

  void clear(size_t set_length) {
    std::memset(members_.Hb_adapter_list, 0, set_length);
    set_count(0);
  }

  // Adds or removes a member. One that the set has no bit for, or that is already as wanted, changes nothing.
  void change(uint32_t member, bool add) {
    if (member >= HB_ADAPTER_SET_LENGTH * 8U || contains(static_cast<int>(member)) == add) {
      return;
    }
    members_.Hb_adapter_list[member / 8] ^= mask_of(static_cast<int>(member));
    // Unsigned, as the count is the caller's and may stand at either end.
    set_count(static_cast<int32_t>(static_cast<uint32_t>(count()) + (add ? 1U : ~0U)));
  }

  // The first member from start on and below bound, or -1.
  int find(int start, int bound) const {
    if (start < 0) {
      return -1;
    }
    bound = std::min(bound, HB_ADAPTER_SET_LENGTH * 8);
    int position = start;
    while (position < bound && !contains(position)) {
      position = rest_of_byte_is_empty(position) ? skip_empty_bytes(position / 8 + 1, bound) : position + 1;
    }
    return position < bound ? position : -1;
  }

 private:
  static uint8_t mask_of(int member) { return static_cast<uint8_t>(0x80U >> (member % 8)); }
  bool contains(int member) const { return (members_.Hb_adapter_list[member / 8] & mask_of(member)) != 0; }
  bool rest_of_byte_is_empty(int position) const {
    return (members_.Hb_adapter_list[position / 8] & (0xFFU >> (position % 8))) == 0;
  }

  // First position of the next byte in use.
  int skip_empty_bytes(int byte, int bound) const {
    const int end = (bound + 7) / 8;
    uint64_t word = 0;
    while (byte + static_cast<int>(sizeof word) <= end) {
      std::memcpy(&word, members_.Hb_adapter_list + byte, sizeof word);
      if (word != 0) {
        break;
      }
      byte += static_cast<int>(sizeof word);
    }
    while (byte < end && members_.Hb_adapter_list[byte] == 0) {
      ++byte;
    }
    return byte * 8;
  }

  Hb_Adapter_Subscription_Grp& members_;
};
