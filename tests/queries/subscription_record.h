// A subscription group as bytes, and a client of the sparse cluster with two sites.
#pragma once

#include <gmock/gmock.h>

#include <cstdint>
#include <cstring>
#include <limits>
#include <string>
#include <vector>

#include "test_cluster.h"

namespace hb_test {

inline constexpr size_t count_offset = 48;
inline constexpr size_t set_offset = 52;
inline constexpr size_t record_size = 12348;

// Types that no group has, as a caller may leave them in a record.
inline constexpr int32_t odd_types[] = {10, -1, std::numeric_limits<int32_t>::max()};

inline Hb_Subscription_Group group_filled_with(uint8_t byte, int32_t type) {
  Hb_Subscription_Group group;
  std::memset(&group, byte, sizeof group);
  group.Hb_subscription_type = static_cast<Hb_Subscription_Type>(type);
  return group;
}

inline Hb_Subscription_Group group_of_type(int32_t type) { return group_filled_with(0, type); }

inline uint8_t byte_at(const Hb_Subscription_Group& group, size_t offset) {
  return reinterpret_cast<const uint8_t*>(&group)[offset];
}

inline uint8_t set_byte(const Hb_Subscription_Group& group, size_t index) { return byte_at(group, set_offset + index); }

inline int32_t count_of(const Hb_Subscription_Group& group) {
  int32_t count;
  std::memcpy(&count, reinterpret_cast<const char*>(&group) + count_offset, sizeof count);
  return count;
}

inline void set_count(Hb_Subscription_Group& group, int32_t count) {
  std::memcpy(reinterpret_cast<char*>(&group) + count_offset, &count, sizeof count);
}

inline void set_member(Hb_Subscription_Group& group, size_t member) {
  reinterpret_cast<uint8_t*>(&group)[set_offset + member / 8] |= static_cast<uint8_t>(0x80U >> (member % 8));
}

// The members in the first `length` bytes of the set, the most significant bit of each byte first.
inline std::vector<size_t> members_of(const Hb_Subscription_Group& group, size_t length) {
  std::vector<size_t> members;
  for (size_t member = 0; member < length * 8; ++member) {
    if ((set_byte(group, member / 8) & (0x80U >> (member % 8))) != 0) members.push_back(member);
  }
  return members;
}

inline bool same_bytes(const Hb_Subscription_Group& left, const Hb_Subscription_Group& right) {
  return std::memcmp(&left, &right, sizeof left) == 0;
}

// A group that was filled with 0xFF, and of which at most type and members were written since.
inline void expect_header_untouched(const Hb_Subscription_Group& group) {
  EXPECT_EQ(-1, group.Hb_cursor);
  EXPECT_EQ(-1, group.Hb_events);
  EXPECT_THAT(group.Hb_name, testing::Each('\xFF'));
  EXPECT_EQ(-1, group.Hb_netnum);
}

inline void configure_sites(const std::vector<bool>& configured) {
  global_config_tbl.Hb_max_sites = static_cast<int>(configured.size());
  global_num_sites = 0;
  for (size_t site = 0; site < configured.size(); ++site) {
    global_site_tbl[site] = configured[site] ? Hb_True : Hb_False;
    global_num_sites += configured[site] ? 1 : 0;
  }
}

// The sparse cluster with two sites, of which site 1 is configured.
class Subscription : public Loaded_Client {
 protected:
  Subscription() { configure_sites({false, true}); }
};

// The four names of VEX mode, as texts.
inline std::vector<std::string> names() {
  return {nodeEventSubscriptionName, networkEventSubscriptionName, siteEventSubscriptionName,
          splitMergeEventSubscriptionName};
}

inline void set_name(Hb_Name& slot, const char* text) {
  std::memset(slot, 0, sizeof slot);
  std::memcpy(slot, text, std::strlen(text));
}

}  // namespace hb_test
