// Chained hash tables.
#include "hash.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>
#include <new>
#include <string>
#include <vector>

#include "support/allocation_faults.h"
#include "utils.h"

namespace {

struct Recorded_Block {
  int size;
  std::string tag;
  bool operator==(const Recorded_Block&) const = default;
};

std::vector<Recorded_Block>* recorded_blocks = nullptr;

}  // namespace

// The tables' allocator, recorded where a test asks for it.
extern "C" {
void __real__Z10cpp_mallocPPviPKc(void** p, int size, const char* tag);
void __wrap__Z10cpp_mallocPPviPKc(void** p, int size, const char* tag);
void __wrap__Z10cpp_mallocPPviPKc(void** p, int size, const char* tag) {
  if (recorded_blocks != nullptr) {
    recorded_blocks->push_back({size, tag});
  }
  __real__Z10cpp_mallocPPviPKc(p, size, tag);
}
}

namespace hb_test {
namespace {

using testing::ElementsAre;

char items[] = "abcdefgh";
void* item(size_t index) { return &items[index]; }

std::vector<char> visited;

int visit(void* visited_item) {
  visited.push_back(*static_cast<char*>(visited_item));
  return 1;
}

class HashTable : public testing::Test {
 protected:
  HashTable() { visited.clear(); }
  ~HashTable() override {
    recorded_blocks = nullptr;
    Hash_free(table);
  }

  std::vector<char> all_items() {
    visited.clear();
    Hash_table_call(table, visit);
    return visited;
  }

  H_obj_str* head(uint32_t bucket) { return table->table[bucket]; }

  H_table_str* table = Hash_init("table", 257);
};

H_IPv6_key_t key_of(uint32_t a, uint32_t b, uint32_t c, uint32_t d) { return {{a, b, c, d}}; }

// Layout.

TEST(HashLayout, OfTheTable) {
  EXPECT_EQ(sizeof(H_table_str), 24U);
  EXPECT_EQ(offsetof(H_table_str, table), 0U);
  EXPECT_EQ(offsetof(H_table_str, name), 8U);
  EXPECT_EQ(offsetof(H_table_str, size), 16U);
  EXPECT_EQ(offsetof(H_table_str, entries), 20U);
}

TEST(HashLayout, OfAnEntry) {
  EXPECT_EQ(sizeof(Hobj), 48U);
  EXPECT_EQ(sizeof(Hobj::ku), 16U);
  EXPECT_EQ(offsetof(Hobj, ku.k1k2.key), 0U);
  EXPECT_EQ(offsetof(Hobj, ku.k1k2.key2), 4U);
  EXPECT_EQ(offsetof(Hobj, ku.key_IPv6), 0U);
  EXPECT_EQ(offsetof(Hobj, pointer), 16U);
  EXPECT_EQ(offsetof(Hobj, next), 24U);
  EXPECT_EQ(offsetof(Hobj, prev), 32U);
  EXPECT_EQ(offsetof(Hobj, keyType), 40U);
  EXPECT_EQ(sizeof(H_obj_keyType), 4U);
}

TEST(HashLayout, OfTheCursor) {
  EXPECT_EQ(offsetof(H_cursor_str, bucket), 0U);
  EXPECT_EQ(offsetof(H_cursor_str, obj), 8U);
}

TEST(HashLayout, KindsOfKeyHaveTheirNumbers) {
  EXPECT_EQ(H_KT_LONG, 1);
  EXPECT_EQ(H_KT_LONG2, 2);
  EXPECT_EQ(H_KT_IPv6, 3);
}

// Creation.

class HashInitSize : public testing::TestWithParam<std::pair<int, int>> {};

TEST_P(HashInitSize, IsAtLeast257AndElseAsGiven) {
  H_table_str* table = Hash_init("table", GetParam().first);
  EXPECT_EQ(table->size, GetParam().second);
  Hash_free(table);
}

INSTANTIATE_TEST_SUITE_P(Sizes, HashInitSize,
                         testing::Values(std::pair(-5, 257), std::pair(0, 257), std::pair(1, 257), std::pair(256, 257),
                                         std::pair(257, 257), std::pair(258, 258), std::pair(300, 300)));

TEST_F(HashTable, StartsEmpty) {
  EXPECT_EQ(table->entries, 0);
  for (uint32_t bucket = 0; bucket < 257; ++bucket) {
    EXPECT_EQ(head(bucket), nullptr) << bucket;
  }
}

TEST_F(HashTable, KeepsACopyOfItsName) {
  char name[] = "first";
  H_table_str* named = Hash_init(name, 257);
  name[0] = 'X';
  EXPECT_STREQ(named->name, "first");
  Hash_free(named);
}

TEST_F(HashTable, IsAllocatedInTaggedBlocks) {
  std::vector<Recorded_Block> blocks;
  recorded_blocks = &blocks;
  H_table_str* other = Hash_init("other", 300);
  recorded_blocks = nullptr;
  EXPECT_THAT(blocks, ElementsAre(Recorded_Block{24, "Hash_init"}, Recorded_Block{2400, "Hash_init"}));
  Hash_free(other);
}

TEST_F(HashTable, EntriesAre48BytesWithTheTagOfTheirOperation) {
  std::vector<Recorded_Block> blocks;
  recorded_blocks = &blocks;
  Hash_insert(1, table, item(0));
  Hash_insert2(2, 3, table, item(1));
  H_IPv6_key_t key = key_of(1, 2, 3, 4);
  Hash_insert_IPv6(&key, table, item(2));
  EXPECT_THAT(blocks, ElementsAre(Recorded_Block{48, "Hash_insert"}, Recorded_Block{48, "Hash_insert"},
                                  Recorded_Block{48, "Hash_insert_IPv6"}));
}

TEST_F(HashTable, CreationWithoutMemoryThrowsAndHoldsNothing) {
  for (size_t nth = 1;; ++nth) {
    const long live = live_allocations();
    H_table_str* made = nullptr;
    bool happened = false;
    bool threw = false;
    {
      const AllocationFailure failure(nth);
      try {
        made = Hash_init("other", 300);
      } catch (const std::bad_alloc&) {
        threw = true;
      }
      happened = failure.happened();
    }
    EXPECT_EQ(threw, happened);
    if (!happened) {
      EXPECT_EQ(nth, 4U);  // record, buckets and name
      Hash_free(made);
      break;
    }
    EXPECT_EQ(live_allocations(), live);
  }
}

// prime and IndexHash.

class Prime : public testing::TestWithParam<std::pair<int, int>> {};

TEST_P(Prime, RaisesToTheNextNumberThatNoDivisorBelowItsRootDivides) {
  EXPECT_EQ(prime(GetParam().first), GetParam().second);
}

INSTANTIATE_TEST_SUITE_P(BelowFiveUnchanged, Prime,
                         testing::Values(std::pair(-7, -7), std::pair(0, 0), std::pair(1, 1), std::pair(2, 2),
                                         std::pair(3, 3), std::pair(4, 4)));
INSTANTIATE_TEST_SUITE_P(SquaresOfPrimesPass, Prime,
                         testing::Values(std::pair(8, 9), std::pair(9, 9), std::pair(24, 25), std::pair(25, 25),
                                         std::pair(48, 49), std::pair(121, 121)));
INSTANTIATE_TEST_SUITE_P(Others, Prime,
                         testing::Values(std::pair(5, 5), std::pair(6, 7), std::pair(10, 11), std::pair(14, 17),
                                         std::pair(16, 17), std::pair(26, 29), std::pair(200, 211),
                                         std::pair(4098, 4099), std::pair(2147483646, 2147483647)));

TEST(IndexHashOfText, IsZeroForTheEmptyText) { EXPECT_EQ(IndexHash(""), 0); }

TEST(IndexHashOfText, ShiftsEverySecondByteByEight) {
  EXPECT_EQ(IndexHash("A"), 0x41);
  EXPECT_EQ(IndexHash("AB"), 0x4241);
  EXPECT_EQ(IndexHash("ABC"), 0x4202);
  EXPECT_EQ(IndexHash("ABCD"), 0x0602);
}

TEST(IndexHashOfText, TakesBytesUnsigned) {
  EXPECT_EQ(IndexHash("\x80"), 0x80);
  EXPECT_EQ(IndexHash("\x80\xff"), 0xff80);
}

// Locating.

TEST_F(HashTable, LocatesAnAbsentKeyInAnEmptyBucket) {
  H_obj_str* entry = reinterpret_cast<H_obj_str*>(items);
  EXPECT_EQ(FindHashLoc(5, table, &entry), -6);
  EXPECT_EQ(entry, nullptr);
  EXPECT_EQ(FindHashLoc(0, table, &entry), -1);
}

TEST_F(HashTable, LocatesAnAbsentKeyBehindTheLastEntryOfItsChain) {
  Hash_insert(5, table, item(0));
  Hash_insert(5 + 257, table, item(1));
  H_obj_str* entry = nullptr;
  EXPECT_EQ(FindHashLoc(5 + 2 * 257, table, &entry), -6);
  ASSERT_NE(entry, nullptr);
  EXPECT_EQ(entry->pointer, item(1));
}

TEST_F(HashTable, LocatesAKeyByItsBucketAndEntry) {
  Hash_insert(0, table, item(0));
  Hash_insert(5, table, item(1));
  Hash_insert(5 + 257, table, item(2));
  H_obj_str* entry = nullptr;
  EXPECT_EQ(FindHashLoc(0, table, &entry), 1);
  EXPECT_EQ(entry->pointer, item(0));
  EXPECT_EQ(FindHashLoc(5, table, &entry), 6);
  EXPECT_EQ(entry->pointer, item(1));
  EXPECT_EQ(FindHashLoc(5 + 257, table, &entry), 6);
  EXPECT_EQ(entry->pointer, item(2));
}

TEST_F(HashTable, LocatesTwoKeysInTheBucketOfTheFirst) {
  Hash_insert2(5, 900, table, item(0));
  H_obj_str* entry = nullptr;
  EXPECT_EQ(FindHashLoc2(5, 900, table, &entry), 6);
  EXPECT_EQ(entry->pointer, item(0));
  EXPECT_EQ(FindHashLoc2(5, 901, table, &entry), -6);
  EXPECT_EQ(entry->pointer, item(0));
  EXPECT_EQ(FindHashLoc2(6, 900, table, &entry), -7);
  EXPECT_EQ(entry, nullptr);
}

TEST_F(HashTable, LocatesAnAddressInTheBucketOfItsWordSum) {
  H_IPv6_key_t key = key_of(1, 2, 3, 4);
  Hash_insert_IPv6(&key, table, item(0));
  H_obj_str* entry = nullptr;
  EXPECT_EQ(FindHashLoc_IPv6(&key, table, &entry), 11);
  EXPECT_EQ(entry->pointer, item(0));
  H_IPv6_key_t same_sum = key_of(4, 3, 2, 1);
  EXPECT_EQ(FindHashLoc_IPv6(&same_sum, table, &entry), -11);
  EXPECT_EQ(entry->pointer, item(0));
  H_IPv6_key_t other = key_of(0, 0, 0, 7);
  EXPECT_EQ(FindHashLoc_IPv6(&other, table, &entry), -8);
  EXPECT_EQ(entry, nullptr);
}

TEST_F(HashTable, TakesKeysAsUnsignedNumbers) {
  H_obj_str* entry = nullptr;
  EXPECT_EQ(FindHashLoc(0xFFFFFFFFU, table, &entry), -1);    // 2^32 is 1 modulo 257
  EXPECT_EQ(FindHashLoc(0xFFFFFFFEU, table, &entry), -257);  // bucket 256
}

TEST_F(HashTable, SumsTheWordsOfAnAddressModulo32Bits) {
  H_obj_str* entry = nullptr;
  H_IPv6_key_t key = key_of(0xFFFFFFFFU, 0xFFFFFFFFU, 2, 6);  // 6 after the overflow
  EXPECT_EQ(FindHashLoc_IPv6(&key, table, &entry), -7);
}

// Inserting and searching.

TEST_F(HashTable, InsertOfANewKeyReturnsNullAndCounts) {
  EXPECT_EQ(Hash_insert(1, table, item(0)), nullptr);
  EXPECT_EQ(Hash_insert2(2, 3, table, item(1)), nullptr);
  H_IPv6_key_t key = key_of(9, 9, 9, 9);
  EXPECT_EQ(Hash_insert_IPv6(&key, table, item(2)), nullptr);
  EXPECT_EQ(table->entries, 3);
  EXPECT_EQ(Hash_entries(table), 3);
}

TEST_F(HashTable, InsertOfAKnownKeyReplacesTheItemAndReturnsTheOldOne) {
  Hash_insert(1, table, item(0));
  EXPECT_EQ(Hash_insert(1, table, item(1)), item(0));
  EXPECT_EQ(Hash_search(1, table), item(1));
  EXPECT_EQ(Hash_entries(table), 1);
}

TEST_F(HashTable, InsertOfTwoKnownKeysReplaces) {
  Hash_insert2(1, 2, table, item(0));
  EXPECT_EQ(Hash_insert2(1, 3, table, item(1)), nullptr);
  EXPECT_EQ(Hash_insert2(1, 2, table, item(2)), item(0));
  EXPECT_EQ(Hash_search2(1, 2, table), item(2));
  EXPECT_EQ(Hash_search2(1, 3, table), item(1));
  EXPECT_EQ(Hash_entries(table), 2);
}

TEST_F(HashTable, InsertOfAKnownAddressReplaces) {
  H_IPv6_key_t key = key_of(1, 2, 3, 4);
  Hash_insert_IPv6(&key, table, item(0));
  H_IPv6_key_t same = key_of(1, 2, 3, 4);
  EXPECT_EQ(Hash_insert_IPv6(&same, table, item(1)), item(0));
  EXPECT_EQ(Hash_search_IPv6(&key, table), item(1));
  EXPECT_EQ(Hash_entries(table), 1);
}

TEST_F(HashTable, EntryHoldsItsKeyItsItemAndItsKind) {
  Hash_insert(5, table, item(0));
  Hash_insert2(6, 77, table, item(1));
  H_IPv6_key_t key = key_of(1, 2, 0, 4);
  Hash_insert_IPv6(&key, table, item(2));
  EXPECT_EQ(head(5)->ku.k1k2.key, 5U);
  EXPECT_EQ(head(5)->pointer, item(0));
  EXPECT_EQ(head(5)->keyType, 1);
  EXPECT_EQ(head(6)->ku.k1k2.key, 6U);
  EXPECT_EQ(head(6)->ku.k1k2.key2, 77U);
  EXPECT_EQ(head(6)->keyType, 2);
  EXPECT_EQ(std::memcmp(&head(7)->ku.key_IPv6, &key, 16), 0);
  EXPECT_EQ(head(7)->keyType, 3);
}

TEST_F(HashTable, ChainIsInOrderOfInsertionAndLinkedBothWays) {
  Hash_insert(5, table, item(0));
  Hash_insert(5 + 257, table, item(1));
  Hash_insert(5 + 2 * 257, table, item(2));
  H_obj_str* first = head(5);
  H_obj_str* second = first->next;
  H_obj_str* third = second->next;
  EXPECT_EQ(first->pointer, item(0));
  EXPECT_EQ(second->pointer, item(1));
  EXPECT_EQ(third->pointer, item(2));
  EXPECT_EQ(third->next, nullptr);
  EXPECT_EQ(first->prev, nullptr);
  EXPECT_EQ(second->prev, first);
  EXPECT_EQ(third->prev, second);
}

TEST_F(HashTable, ReplacingKeepsThePlaceInTheChain) {
  Hash_insert(5, table, item(0));
  Hash_insert(5 + 257, table, item(1));
  Hash_insert(5, table, item(2));
  EXPECT_THAT(all_items(), ElementsAre('c', 'b'));
}

TEST_F(HashTable, SearchFindsNothingForAbsentKeys) {
  Hash_insert(5, table, item(0));
  EXPECT_EQ(Hash_search(6, table), nullptr);
  EXPECT_EQ(Hash_search(5 + 257, table), nullptr);
  EXPECT_EQ(Hash_search2(6, 0, table), nullptr);
  H_IPv6_key_t other = key_of(0, 5, 0, 0);
  EXPECT_EQ(Hash_search_IPv6(&other, table), nullptr);
}

TEST_F(HashTable, OneKeySearchNeverLooksAtTheSecondKey) {
  Hash_insert2(5, 42, table, item(0));
  EXPECT_EQ(Hash_search(5, table), item(0));
  EXPECT_EQ(Hash_search2(5, 42, table), item(0));
  EXPECT_EQ(Hash_search2(5, 43, table), nullptr);
}

TEST_F(HashTable, OneKeyInsertReplacesWhatWasInsertedUnderTwo) {
  Hash_insert2(5, 42, table, item(0));
  EXPECT_EQ(Hash_insert(5, table, item(1)), item(0));
  EXPECT_EQ(head(5)->keyType, 2);
  EXPECT_EQ(Hash_entries(table), 1);
}

TEST_F(HashTable, ComparesEveryByteOfAnAddress) {
  H_IPv6_key_t key = key_of(1, 2, 3, 4);
  Hash_insert_IPv6(&key, table, item(0));
  H_IPv6_key_t last_differs = key_of(1, 2, 3, 4 + 257);
  EXPECT_EQ(Hash_search_IPv6(&last_differs, table), nullptr);
  H_IPv6_key_t first_differs = key_of(1 + 257, 2, 3, 4);
  EXPECT_EQ(Hash_search_IPv6(&first_differs, table), nullptr);
}

TEST_F(HashTable, NullItemsAreStored) {
  EXPECT_EQ(Hash_insert(1, table, nullptr), nullptr);
  EXPECT_EQ(Hash_entries(table), 1);
  EXPECT_EQ(Hash_search(1, table), nullptr);
}

TEST_F(HashTable, NeverGrows) {
  for (uint32_t key = 0; key < 2000; ++key) {
    Hash_insert(key, table, item(0));
  }
  EXPECT_EQ(table->size, 257);
  EXPECT_EQ(Hash_entries(table), 2000);
}

TEST_F(HashTable, InsertWithoutMemoryThrowsAndChangesNothing) {
  Hash_insert(5, table, item(0));
  bool threw = false;
  {
    const AllocationFailure failure(1);
    try {
      Hash_insert(5 + 257, table, item(1));
    } catch (const std::bad_alloc&) {
      threw = true;
    }
  }
  EXPECT_TRUE(threw);
  EXPECT_EQ(Hash_entries(table), 1);
  EXPECT_THAT(all_items(), ElementsAre('a'));
}

// Deleting.

TEST_F(HashTable, DeleteOfAnAbsentKeyReturnsNullAndKeepsTheCount) {
  Hash_insert(5, table, item(0));
  H_IPv6_key_t key = key_of(0, 6, 0, 0);
  EXPECT_EQ(Hash_delete(6, table), nullptr);
  EXPECT_EQ(Hash_delete(5 + 257, table), nullptr);
  EXPECT_EQ(Hash_delete2(5, 1234, table), nullptr);
  EXPECT_EQ(Hash_delete_IPv6(&key, table), nullptr);
  EXPECT_EQ(Hash_entries(table), 1);
}

TEST_F(HashTable, DeleteOfTheOnlyEntryEmptiesItsBucket) {
  Hash_insert(5, table, item(0));
  EXPECT_EQ(Hash_delete(5, table), item(0));
  EXPECT_EQ(head(5), nullptr);
  EXPECT_EQ(Hash_entries(table), 0);
  EXPECT_EQ(Hash_search(5, table), nullptr);
}

TEST_F(HashTable, DeleteReleasesTheEntryAndNotTheItem) {
  const int before = memchunks;
  Hash_insert(5, table, item(0));
  EXPECT_EQ(memchunks, before + 1);
  Hash_delete(5, table);
  EXPECT_EQ(memchunks, before);
  EXPECT_EQ(items[0], 'a');
}

class ThreeInAChain : public HashTable {
 protected:
  ThreeInAChain() {
    Hash_insert(5, table, item(0));
    Hash_insert(5 + 257, table, item(1));
    Hash_insert(5 + 2 * 257, table, item(2));
  }
};

TEST_F(ThreeInAChain, DeleteOfTheHeadKeepsTheOthersInOrder) {
  const auto removed = reinterpret_cast<uintptr_t>(head(5));
  EXPECT_EQ(Hash_delete(5, table), item(0));
  EXPECT_THAT(all_items(), ElementsAre('b', 'c'));
  EXPECT_EQ(Hash_entries(table), 2);
  EXPECT_EQ(Hash_search(5 + 257, table), item(1));
  // The new head keeps its link to the entry that was removed; the link behind it is whole.
  EXPECT_EQ(reinterpret_cast<uintptr_t>(head(5)->prev), removed);
  EXPECT_EQ(head(5)->next->prev, head(5));
}

TEST_F(ThreeInAChain, DeleteInTheMiddleLinksTheNeighbours) {
  EXPECT_EQ(Hash_delete(5 + 257, table), item(1));
  EXPECT_THAT(all_items(), ElementsAre('a', 'c'));
  EXPECT_EQ(head(5)->next->prev, head(5));
  EXPECT_EQ(Hash_search(5 + 2 * 257, table), item(2));
}

TEST_F(ThreeInAChain, DeleteOfTheTailEndsTheChainBeforeIt) {
  EXPECT_EQ(Hash_delete(5 + 2 * 257, table), item(2));
  EXPECT_THAT(all_items(), ElementsAre('a', 'b'));
  EXPECT_EQ(head(5)->next->next, nullptr);
}

TEST_F(ThreeInAChain, AKeyDeletedMayBeInsertedAgainAtTheTail) {
  Hash_delete(5, table);
  EXPECT_EQ(Hash_insert(5, table, item(3)), nullptr);
  EXPECT_THAT(all_items(), ElementsAre('b', 'c', 'd'));
  EXPECT_EQ(Hash_entries(table), 3);
}

TEST_F(HashTable, DeleteWithTwoKeysNeedsBoth) {
  Hash_insert2(5, 1, table, item(0));
  Hash_insert2(5, 2, table, item(1));
  Hash_insert2(5, 3, table, item(2));
  EXPECT_EQ(Hash_delete2(5, 2, table), item(1));
  EXPECT_THAT(all_items(), ElementsAre('a', 'c'));
  EXPECT_EQ(Hash_delete2(5, 1, table), item(0));
  EXPECT_EQ(Hash_delete2(5, 3, table), item(2));
  EXPECT_EQ(Hash_entries(table), 0);
}

TEST_F(HashTable, DeleteWithOneKeyTakesTheFirstThatHasIt) {
  Hash_insert2(5, 1, table, item(0));
  Hash_insert2(5, 2, table, item(1));
  EXPECT_EQ(Hash_delete(5, table), item(0));
  EXPECT_THAT(all_items(), ElementsAre('b'));
}

TEST_F(HashTable, DeleteOfAnAddress) {
  H_IPv6_key_t first = key_of(1, 2, 3, 4);
  H_IPv6_key_t second = key_of(4, 3, 2, 1);
  H_IPv6_key_t third = key_of(2, 2, 3, 3);
  Hash_insert_IPv6(&first, table, item(0));
  Hash_insert_IPv6(&second, table, item(1));
  Hash_insert_IPv6(&third, table, item(2));
  EXPECT_EQ(Hash_delete_IPv6(&second, table), item(1));
  EXPECT_THAT(all_items(), ElementsAre('a', 'c'));
  EXPECT_EQ(Hash_delete_IPv6(&third, table), item(2));
  EXPECT_EQ(Hash_delete_IPv6(&first, table), item(0));
  EXPECT_EQ(Hash_entries(table), 0);
}

// Releasing and emptying.

TEST(HashFree, ReleasesTableNameBucketsAndEntriesButNoItem) {
  const int before = memchunks;
  const long live = live_allocations();
  H_table_str* table = Hash_init("table", 257);
  for (uint32_t key = 0; key < 600; ++key) {
    Hash_insert(key, table, item(0));
  }
  ASSERT_EQ(memchunks, before + 603);
  Hash_free(table);
  EXPECT_EQ(memchunks, before);
  EXPECT_EQ(live_allocations(), live);
  EXPECT_EQ(items[0], 'a');
}

TEST_F(HashTable, CleanReleasesTheEntriesAndLeavesATableToUse) {
  const int before = memchunks;
  Hash_insert(5, table, item(0));
  Hash_insert(5 + 257, table, item(1));
  Hash_insert(9, table, item(2));
  Hash_clean(table);
  EXPECT_EQ(memchunks, before);
  EXPECT_EQ(Hash_entries(table), 0);
  EXPECT_EQ(head(5), nullptr);
  EXPECT_EQ(head(9), nullptr);
  EXPECT_STREQ(table->name, "table");
  EXPECT_EQ(table->size, 257);
  EXPECT_EQ(Hash_insert(5, table, item(3)), nullptr);
  EXPECT_EQ(Hash_search(5, table), item(3));
}

// Going through a table.

TEST_F(HashTable, CallVisitsBucketsAscendingAndChainsFromTheirHead) {
  Hash_insert(200, table, item(0));
  Hash_insert(5 + 257, table, item(1));
  Hash_insert(5, table, item(2));
  Hash_insert(0, table, item(3));
  Hash_insert(256, table, item(4));
  EXPECT_THAT(all_items(), ElementsAre('d', 'b', 'c', 'a', 'e'));
}

TEST_F(HashTable, CursorGoesInTheSameOrder) {
  Hash_insert(200, table, item(0));
  Hash_insert(5 + 257, table, item(1));
  Hash_insert(5, table, item(2));
  H_cursor_str cursor{};
  EXPECT_EQ(Hash_first(table, &cursor), item(1));
  EXPECT_EQ(cursor.bucket, 5);
  EXPECT_EQ(cursor.obj, head(5));
  EXPECT_EQ(Hash_next(table, &cursor), item(2));
  EXPECT_EQ(cursor.bucket, 5);
  EXPECT_EQ(Hash_next(table, &cursor), item(0));
  EXPECT_EQ(cursor.bucket, 200);
  EXPECT_EQ(Hash_next(table, &cursor), nullptr);
  EXPECT_EQ(cursor.obj, nullptr);
  EXPECT_EQ(cursor.bucket, 257);
  EXPECT_EQ(Hash_next(table, &cursor), nullptr);
  EXPECT_EQ(Hash_next(table, &cursor), nullptr);
}

TEST_F(HashTable, CursorEndsBehindAnEntryInTheLastBucket) {
  Hash_insert(256, table, item(0));
  H_cursor_str cursor{};
  EXPECT_EQ(Hash_first(table, &cursor), item(0));
  EXPECT_EQ(Hash_next(table, &cursor), nullptr);
  EXPECT_EQ(cursor.bucket, 257);
}

TEST_F(HashTable, FirstOfAnEmptyTableLeavesTheCursorAtTheEnd) {
  H_cursor_str cursor{7, reinterpret_cast<H_obj_str*>(items)};
  EXPECT_EQ(Hash_first(table, &cursor), nullptr);
  EXPECT_EQ(cursor.bucket, 257);
  EXPECT_EQ(cursor.obj, nullptr);
  EXPECT_EQ(Hash_next(table, &cursor), nullptr);
}

TEST_F(HashTable, NextWithoutACursorIsNull) { EXPECT_EQ(Hash_next(table, nullptr), nullptr); }

// Dumping.

int tell_item(void* told) {
  std::fprintf(stderr, "item %s\n", static_cast<const char*>(told));
  return 0;
}

TEST_F(HashTable, DumpTellsBucketKeyAndItemOfEveryEntry) {
  char one[] = "one";
  char two[] = "two";
  char three[] = "three";
  H_IPv6_key_t key = key_of(0xABCD, 0, 0, 0);  // 0xABCD is 34 modulo 257
  Hash_insert(5 + 257, table, one);
  Hash_insert(5, table, two);
  Hash_insert_IPv6(&key, table, three);
  testing::internal::CaptureStderr();
  Hash_dump_table(table, tell_item);
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "\nDumping Hash Table \"table\"\n"
            "Bucket 5: key > 0x00000106\nitem one\n"
            "Bucket 5: key > 0x00000005\nitem two\n"
            "Bucket 34: key > 0x0000ABCD\nitem three\n");
}

TEST_F(HashTable, DumpOfATextItem) {
  testing::internal::CaptureStderr();
  EXPECT_EQ(Hash_dump_string("some text"), 0);
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "object > \"some text\"\n");
}

TEST_F(HashTable, DumpOfAnEmptyTableIsItsTitle) {
  testing::internal::CaptureStderr();
  Hash_dump_table(table, tell_item);
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "\nDumping Hash Table \"table\"\n");
}

// A table that is not there.

TEST(NoTable, HoldsNothing) {
  H_IPv6_key_t key = key_of(1, 2, 3, 4);
  EXPECT_EQ(Hash_search(1, nullptr), nullptr);
  EXPECT_EQ(Hash_search2(1, 2, nullptr), nullptr);
  EXPECT_EQ(Hash_search_IPv6(&key, nullptr), nullptr);
}

}  // namespace
}  // namespace hb_test
