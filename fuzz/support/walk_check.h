// A first/next pair, compared with the members that it has to find.
#pragma once

#include <algorithm>
#include <vector>

#include "hb_client/error.h"
#include "support/conventions.h"

namespace fuzz {

template <typename Item>
struct Position {
  int position;
  Item item;
};

// Members by ascending position. Reused from run to run, so that a run allocates nothing.
template <typename Item>
class Expected {
 public:
  Expected() { members_.reserve(capacity); }
  void clear() { members_.clear(); }
  void add(int position, Item item) { members_.push_back({position, item}); }
  const std::vector<Position<Item>>& members() const { return members_; }

  // The first member at a cursor or behind it; null when there is none. Nothing is in front of a list.
  const Position<Item>* from(Hb_Cursor cursor) const {
    const auto found =
        cursor < 0 ? members_.end()
                   : std::lower_bound(members_.begin(), members_.end(), cursor,
                                      [](const Position<Item>& member, int at) { return member.position < at; });
    return found != members_.end() ? &*found : nullptr;
  }

 private:
  static constexpr size_t capacity = 1024;
  std::vector<Position<Item>> members_;
};

// One call of the pair. `step` makes it and leaves what it yields in `item` and `cursor`, which it refers to.
template <typename Item, typename Step>
void check_step(const Position<Item>* member, const Item& none, Item& item, Hb_Cursor& cursor, Step step) {
  const Hb_Cursor before = cursor;
  expect(member != nullptr ? no_error : int{HB_ENOMORE}, step);
  REQUIRE(item == (member != nullptr ? member->item : none));
  REQUIRE(cursor == (member != nullptr ? member->position + 1 : before));
}

// From the first member to the end and once more, then on from a cursor that the walk never set.
template <typename Item, typename First, typename Next>
void check_walk(const Expected<Item>& expected, const Item& none, Item& item, Hb_Cursor& cursor, Hb_Cursor hostile,
                First first, Next next) {
  cursor = hostile;
  check_step(expected.from(0), none, item, cursor, first);
  if (!expected.members().empty()) {
    for (size_t i = 1; i < expected.members().size(); ++i) {
      check_step(&expected.members()[i], none, item, cursor, next);
    }
    check_step<Item>(nullptr, none, item, cursor, next);
    check_step<Item>(nullptr, none, item, cursor, next);
  }
  cursor = hostile;
  check_step(expected.from(hostile), none, item, cursor, next);
}

}  // namespace fuzz
