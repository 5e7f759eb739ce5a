// Operations on a hash table in any order, compared with an ordered list of what is in it.
#include "hash.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <map>
#include <utility>
#include <vector>

#include "support/input.h"
#include "support/require.h"
#include "utils.h"

namespace {

using Key = std::array<uint32_t, 4>;

enum Key_Kind { one_key, two_keys, address };

// Buckets ascending, and in each the keys in the order in which they came.
class Model {
 public:
  Model(Key_Kind kind, int size) : kind_(kind), size_(static_cast<uint32_t>(size <= 256 ? 257 : size)) {}

  uint32_t bucket(const Key& key) const {
    return (kind_ == address ? key[0] + key[1] + key[2] + key[3] : key[0]) % size_;
  }

  void* find(const Key& key) {
    Entry* entry = entry_of(key);
    return entry != nullptr ? entry->item : nullptr;
  }

  void* insert(const Key& key, void* item) {
    if (Entry* entry = entry_of(key)) {
      return std::exchange(entry->item, item);
    }
    buckets_[bucket(key)].push_back({key, item});
    return nullptr;
  }

  void* remove(const Key& key) {
    std::vector<Entry>& chain = buckets_[bucket(key)];
    for (auto entry = chain.begin(); entry != chain.end(); ++entry) {
      if (entry->key == key) {
        void* item = entry->item;
        chain.erase(entry);
        return item;
      }
    }
    return nullptr;
  }

  void clear() { buckets_.clear(); }

  std::vector<void*> items() const {
    std::vector<void*> items;
    for (const auto& [bucket, chain] : buckets_) {
      for (const Entry& entry : chain) {
        items.push_back(entry.item);
      }
    }
    return items;
  }

  // The item at the end of a key's chain; null for an empty one.
  void* last_in_chain(const Key& key) {
    const std::vector<Entry>& chain = buckets_[bucket(key)];
    return chain.empty() ? nullptr : chain.back().item;
  }

 private:
  struct Entry {
    Key key;
    void* item;
  };

  Entry* entry_of(const Key& key) {
    std::vector<Entry>& chain = buckets_[bucket(key)];
    const auto found =
        std::find_if(chain.begin(), chain.end(), [&key](const Entry& entry) { return entry.key == key; });
    return found != chain.end() ? &*found : nullptr;
  }

  Key_Kind kind_;
  uint32_t size_;
  std::map<uint32_t, std::vector<Entry>> buckets_;
};

// The family of operations for one kind of key.
class Table {
 public:
  Table(Key_Kind kind, int size) : kind_(kind), table_(Hash_init("fuzz", size)) {}
  ~Table() { Hash_free(table_); }
  Table(const Table&) = delete;
  Table& operator=(const Table&) = delete;

  H_table_str* get() { return table_; }

  void* search(const Key& key) {
    H_IPv6_key_t words = address_of(key);
    return kind_ == one_key    ? Hash_search(key[0], table_)
           : kind_ == two_keys ? Hash_search2(key[0], key[1], table_)
                               : Hash_search_IPv6(&words, table_);
  }

  void* insert(const Key& key, void* item) {
    H_IPv6_key_t words = address_of(key);
    return kind_ == one_key    ? Hash_insert(key[0], table_, item)
           : kind_ == two_keys ? Hash_insert2(key[0], key[1], table_, item)
                               : Hash_insert_IPv6(&words, table_, item);
  }

  void* remove(const Key& key) {
    H_IPv6_key_t words = address_of(key);
    return kind_ == one_key    ? Hash_delete(key[0], table_)
           : kind_ == two_keys ? Hash_delete2(key[0], key[1], table_)
                               : Hash_delete_IPv6(&words, table_);
  }

  int locate(const Key& key, H_obj_str** entry) {
    H_IPv6_key_t words = address_of(key);
    return kind_ == one_key    ? FindHashLoc(key[0], table_, entry)
           : kind_ == two_keys ? FindHashLoc2(key[0], key[1], table_, entry)
                               : FindHashLoc_IPv6(&words, table_, entry);
  }

 private:
  static H_IPv6_key_t address_of(const Key& key) { return {{key[0], key[1], key[2], key[3]}}; }

  Key_Kind kind_;
  H_table_str* table_;
};

void check_location(Table& table, Model& model, const Key& key) {
  H_obj_str* entry = nullptr;
  const int location = table.locate(key, &entry);
  const int bucket = static_cast<int>(model.bucket(key));
  void* item = model.find(key);
  REQUIRE(location == (item != nullptr ? bucket + 1 : -(bucket + 1)));
  void* expected = item != nullptr ? item : model.last_in_chain(key);
  REQUIRE((entry != nullptr ? entry->pointer : nullptr) == expected);
}

std::vector<void*> called;

int note(void* item) {
  called.push_back(item);
  return 0;
}

void check_order(Table& table, const Model& model) {
  const std::vector<void*> expected = model.items();
  std::vector<void*> found;
  H_cursor_str cursor;
  for (void* item = Hash_first(table.get(), &cursor); item != nullptr; item = Hash_next(table.get(), &cursor)) {
    found.push_back(item);
  }
  REQUIRE(found == expected && Hash_next(table.get(), &cursor) == nullptr);
  REQUIRE(Hash_entries(table.get()) == static_cast<int>(expected.size()));
  called.clear();
  Hash_table_call(table.get(), note);
  REQUIRE(called == expected);
}

// Few different keys, many of them in one bucket.
Key key_from(fuzz::Input& input, Key_Kind kind, int size) {
  const auto choice = input.take<uint8_t>();
  const uint32_t base = (choice & 8U) != 0 ? 0xFFFFFFF0U : 0;
  Key key = {base + (choice & 3U) + (choice & 4U ? static_cast<uint32_t>(size) : 0U), 0, 0, 0};
  if (kind != one_key) {
    key[1] = choice >> 6U;
  }
  if (kind == address) {
    key[2] = choice >> 4U & 3U;
    key[3] = 0U - key[2];
  }
  return key;
}

// Not below the number, and no number from it up to there is without a divisor whose square is below.
void check_prime(int number) {
  const auto passes = [](int64_t candidate) {
    for (int64_t divisor = 2; divisor * divisor < candidate; ++divisor) {
      if (candidate % divisor == 0) {
        return false;
      }
    }
    return true;
  };
  const int found = prime(number);
  REQUIRE(found >= number && passes(found));
  for (int64_t candidate = number; candidate < found; ++candidate) {
    REQUIRE(!passes(candidate));
  }
}

void check_text_hash(fuzz::Bytes bytes) {
  std::array<char, 33> text = {};
  std::copy_n(bytes.begin(), std::min(bytes.size(), text.size() - 1), text.begin());
  uint32_t even = 0;
  uint32_t odd = 0;
  for (size_t i = 0; text[i] != '\0'; ++i) {
    (i % 2 == 0 ? even : odd) ^= static_cast<uint8_t>(text[i]);
  }
  REQUIRE(static_cast<uint32_t>(IndexHash(text.data())) == (even ^ odd << 8U));
}

void perform(Table& table, Model& model, uint8_t operation, const Key& key) {
  static std::array<char, 256> items;
  switch (operation % 8) {
    case 0:
    case 1:
    case 2: {
      void* item = &items[operation];
      REQUIRE(table.insert(key, item) == model.insert(key, item));
      break;
    }
    case 3:
    case 4:
      REQUIRE(table.remove(key) == model.remove(key));
      break;
    case 5:
      check_location(table, model, key);
      break;
    case 6:
      check_order(table, model);
      break;
    default:
      if (operation > 0xF0) {
        Hash_clean(table.get());
        model.clear();
      }
  }
  REQUIRE(table.search(key) == model.find(key));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  constexpr int most_operations = 64;
  const int blocks = memchunks;
  called.reserve(most_operations);
  fuzz::Input input(bytes, size);
  const auto kind = static_cast<Key_Kind>(input.take<uint8_t>() % 3);
  const int table_size = input.take<int16_t>() % 600;
  check_prime(table_size);
  check_text_hash(input.rest());
  {
    Table table(kind, table_size);
    Model model(kind, table_size);
    REQUIRE(table.get()->size == std::max(257, table_size));
    for (int i = 0; i < most_operations && !input.empty(); ++i) {
      const auto operation = input.take<uint8_t>();
      perform(table, model, operation, key_from(input, kind, table.get()->size));
    }
    check_order(table, model);
  }
  REQUIRE(memchunks == blocks);
  return 0;
}
