#include "hash.h"

#include <cstdio>
#include <cstring>
#include <memory>
#include <new>

#include "hash_removals.h"
#include "utils.h"

uint32_t hash_removals = 0;

namespace {

// Each kind of key says which bucket it belongs to, which entry it equals, and how it is stored.
struct One_Key {
  uint32_t name;

  uint32_t bucket(uint32_t size) const { return name % size; }
  bool equals(const H_obj_str& entry) const { return entry.ku.k1k2.key == name; }
  void store(H_obj_str& entry) const {
    entry.ku.k1k2.key = name;
    entry.keyType = H_KT_LONG;
  }
  static constexpr const char* tag = "Hash_insert";
};

struct Two_Keys {
  uint32_t name;
  uint32_t name2;

  uint32_t bucket(uint32_t size) const { return name % size; }
  bool equals(const H_obj_str& entry) const { return entry.ku.k1k2.key == name && entry.ku.k1k2.key2 == name2; }
  void store(H_obj_str& entry) const {
    entry.ku.k1k2.key = name;
    entry.ku.k1k2.key2 = name2;
    entry.keyType = H_KT_LONG2;
  }
  static constexpr const char* tag = "Hash_insert";
};

struct Address_Key {
  const H_IPv6_key_t* keyp;

  uint32_t bucket(uint32_t size) const {
    const uint32_t* word = keyp->uint_elem;
    return (word[0] + word[1] + word[2] + word[3]) % size;
  }
  bool equals(const H_obj_str& entry) const { return std::memcmp(&entry.ku.key_IPv6, keyp, sizeof *keyp) == 0; }
  void store(H_obj_str& entry) const {
    entry.ku.key_IPv6 = *keyp;
    entry.keyType = H_KT_IPv6;
  }
  static constexpr const char* tag = "Hash_insert_IPv6";
};

template <typename Key>
H_obj_str* find(const Key& key, const H_table_str* table) {
  if (table == nullptr) {
    return nullptr;
  }
  H_obj_str* entry = table->table[key.bucket(static_cast<uint32_t>(table->size))];
  while (entry != nullptr && !key.equals(*entry)) {
    entry = entry->next;
  }
  return entry;
}

template <typename Key>
int locate(const Key& key, const H_table_str* table, H_obj_str** obj) {
  *obj = nullptr;
  if (table == nullptr) {
    return -1;
  }
  const uint32_t bucket = key.bucket(static_cast<uint32_t>(table->size));
  for (H_obj_str* entry = table->table[bucket]; entry != nullptr; entry = entry->next) {
    *obj = entry;
    if (key.equals(*entry)) {
      return static_cast<int>(bucket) + 1;
    }
  }
  return ~static_cast<int>(bucket);
}

template <typename Key>
void* search(const Key& key, const H_table_str* table) {
  const H_obj_str* entry = find(key, table);
  return entry != nullptr ? entry->pointer : nullptr;
}

template <typename Key>
void* insert(const Key& key, H_table_str* table, void* newitem) {
  if (table == nullptr) {
    return nullptr;
  }
  H_obj_str* last = nullptr;
  const int location = locate(key, table, &last);
  if (last != nullptr && location > 0) {
    void* previous = last->pointer;
    last->pointer = newitem;
    ++hash_removals;
    return previous;
  }
  void* block = nullptr;
  cpp_malloc(&block, sizeof(H_obj_str), Key::tag);
  auto* entry = new (block) H_obj_str{};
  key.store(*entry);
  entry->pointer = newitem;
  entry->prev = last;
  (last != nullptr ? last->next : table->table[-location - 1]) = entry;
  ++table->entries;
  return nullptr;
}

template <typename Key>
void* remove(const Key& key, H_table_str* table) {
  if (table == nullptr) {
    return nullptr;
  }
  H_obj_str*& head = table->table[key.bucket(static_cast<uint32_t>(table->size))];
  H_obj_str* trailing = head;
  for (H_obj_str* entry = head; entry != nullptr; trailing = entry, entry = entry->next) {
    if (!key.equals(*entry)) {
      continue;
    }
    if (trailing == entry) {
      head = entry->next;
    }
    trailing->next = entry->next;
    if (entry->next != nullptr) {
      entry->next->prev = trailing;  // a new head keeps a link to the removed one; nobody reads it
    }
    void* item = entry->pointer;
    ccst_free(entry);
    --table->entries;
    ++hash_removals;
    return item;
  }
  return nullptr;
}

// Calls visit(bucket, entry) for every entry, buckets ascending, each chain from its head.
template <typename Visit>
void for_each_entry(const H_table_str* table, Visit visit) {
  for (int32_t bucket = 0; table != nullptr && bucket < table->size; ++bucket) {
    for (H_obj_str* entry = table->table[bucket]; entry != nullptr;) {
      H_obj_str* next = entry->next;
      visit(bucket, entry);
      entry = next;
    }
  }
}

struct Release {
  void operator()(void* block) const { ccst_free(block); }
};

template <typename T>
std::unique_ptr<T, Release> allocate(size_t size) {
  void* block = nullptr;
  cpp_malloc(&block, static_cast<int>(size), "Hash_init");
  return std::unique_ptr<T, Release>(static_cast<T*>(block));
}

// Largest table whose bucket array has a size that cpp_malloc can be told.
constexpr size_t bucket_size = sizeof(void*);
constexpr int maximum_size = INT32_MAX / static_cast<int>(bucket_size);

}  // namespace

H_table_str* Hash_init(const char* name, int size) {
  if (size < H_MINIMUM_SIZE) {
    size = H_MINIMUM_SIZE;
  }
  if (size > maximum_size) {
    throw std::bad_alloc();
  }
  const size_t buckets_size = static_cast<size_t>(size) * bucket_size;
  auto table = allocate<H_table_str>(sizeof(H_table_str));
  auto buckets = allocate<H_obj_str*>(buckets_size);
  std::memset(buckets.get(), 0, buckets_size);
  table->size = size;
  table->entries = 0;
  table->name = copy_string(name);
  table->table = buckets.release();
  return table.release();
}

int prime(int number) {
  int64_t candidate = number;
  int64_t divisor = 2;
  // The square of a prime passes, as the last divisor tried lies below the root: table sizes follow from that.
  while (divisor * divisor < candidate) {
    if (candidate % divisor == 0) {
      ++candidate;
      divisor = 2;
    } else {
      ++divisor;
    }
  }
  return static_cast<int>(candidate);
}

int IndexHash(const char* str) {
  uint32_t hash = 0;
  unsigned shift = 0;
  for (; *str != '\0'; ++str) {
    hash ^= static_cast<uint32_t>(static_cast<uint8_t>(*str)) << shift;
    shift = 8 - shift;
  }
  return static_cast<int>(hash);
}

int FindHashLoc(uint32_t name, H_table_str* table, H_obj_str** obj) { return locate(One_Key{name}, table, obj); }
int FindHashLoc2(uint32_t name, uint32_t name2, H_table_str* table, H_obj_str** obj) {
  return locate(Two_Keys{name, name2}, table, obj);
}
int FindHashLoc_IPv6(H_IPv6_key_t* keyp, H_table_str* table, H_obj_str** obj) {
  return locate(Address_Key{keyp}, table, obj);
}

void* Hash_search(uint32_t name, H_table_str* table) { return search(One_Key{name}, table); }
void* Hash_search2(uint32_t name, uint32_t name2, H_table_str* table) { return search(Two_Keys{name, name2}, table); }
void* Hash_search_IPv6(H_IPv6_key_t* keyp, H_table_str* table) { return search(Address_Key{keyp}, table); }

void* Hash_insert(uint32_t name, H_table_str* table, void* newitem) { return insert(One_Key{name}, table, newitem); }
void* Hash_insert2(uint32_t name, uint32_t name2, H_table_str* table, void* newitem) {
  return insert(Two_Keys{name, name2}, table, newitem);
}
void* Hash_insert_IPv6(H_IPv6_key_t* keyp, H_table_str* table, void* newitem) {
  return insert(Address_Key{keyp}, table, newitem);
}

void* Hash_delete(uint32_t name, H_table_str* table) { return remove(One_Key{name}, table); }
void* Hash_delete2(uint32_t name, uint32_t name2, H_table_str* table) { return remove(Two_Keys{name, name2}, table); }
void* Hash_delete_IPv6(H_IPv6_key_t* keyp, H_table_str* table) { return remove(Address_Key{keyp}, table); }

void Hash_free(H_table_str* table) {
  if (table == nullptr) {
    return;
  }
  for_each_entry(table, [](int32_t, H_obj_str* entry) { ccst_free(entry); });
  ++hash_removals;
  ccst_free(table->name);
  ccst_free(table->table);
  ccst_free(table);
}

void Hash_clean(H_table_str* table) {
  if (table == nullptr) {
    return;
  }
  for_each_entry(table, [](int32_t, H_obj_str* entry) { ccst_free(entry); });
  std::memset(table->table, 0, static_cast<size_t>(table->size) * bucket_size);
  table->entries = 0;
  ++hash_removals;
}

int Hash_entries(H_table_str* table) { return table != nullptr ? table->entries : 0; }

void Hash_table_call(H_table_str* table, int (*func)(void*)) {
  for_each_entry(table, [func](int32_t, H_obj_str* entry) { func(entry->pointer); });
}

namespace {

// Moves the cursor to the head of the first bucket in use, from its own bucket on.
void* first_from_bucket(const H_table_str* table, H_cursor_str* cursor) {
  while (cursor->bucket < table->size && table->table[cursor->bucket] == nullptr) {
    ++cursor->bucket;
  }
  cursor->obj = cursor->bucket < table->size ? table->table[cursor->bucket] : nullptr;
  return cursor->obj != nullptr ? cursor->obj->pointer : nullptr;
}

}  // namespace

void* Hash_first(H_table_str* table, H_cursor_str* cursor) {
  cursor->obj = nullptr;
  cursor->bucket = 0;
  return table != nullptr ? first_from_bucket(table, cursor) : nullptr;
}

void* Hash_next(H_table_str* table, H_cursor_str* cursor) {
  if (table == nullptr || cursor == nullptr || cursor->obj == nullptr) {
    return nullptr;
  }
  cursor->obj = cursor->obj->next;
  if (cursor->obj != nullptr) {
    return cursor->obj->pointer;
  }
  ++cursor->bucket;
  return first_from_bucket(table, cursor);
}

void Hash_dump_table(H_table_str* table, int (*df)(void*)) {
  if (table == nullptr) {
    return;
  }
  std::fprintf(stderr, "\nDumping Hash Table \"%s\"\n", table->name);
  for_each_entry(table, [df](int32_t bucket, H_obj_str* entry) {
    std::fprintf(stderr, "Bucket %d: key > 0x%.8X\n", bucket, entry->ku.k1k2.key);
    df(entry->pointer);
  });
}

int Hash_dump_string(const void* s) {
  std::fprintf(stderr, "object > \"%s\"\n", static_cast<const char*>(s));
  return 0;
}
