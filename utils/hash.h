/*
 * Chained hash tables of a fixed number of buckets, keyed by one 32-bit number, by two, or by a 16-byte address.
 *
 * A table owns its buckets, its entries and a copy of its name, never the items. One table holds one kind of key: the
 * operation that is called decides how the key is hashed and compared. The tables have no lock. Creating and inserting
 * throw std::bad_alloc when memory runs out; nothing else fails.
 */
#ifndef HB_CLIENT_HASH_H
#define HB_CLIENT_HASH_H

#include <stddef.h>
#include <stdint.h>

#include "hb_client/types.h"

HB_BEGIN_DECLS

/** A 16-byte key, compared bytewise. */
typedef struct H_IPv6_key_t {
  uint32_t uint_elem[4];
} H_IPv6_key_t;

/** Kind of an entry's key. */
typedef enum H_obj_keyType HB_ENUM_BASE {
  H_KT_LONG = 1,
  H_KT_LONG2 = 2,
  H_KT_IPv6 = 3,
} H_obj_keyType;

/** One entry of a chain. */
typedef struct H_obj_str {
  union {
    struct {
      uint32_t key;
      uint32_t key2;
    } k1k2;
    H_IPv6_key_t key_IPv6;
  } ku;
  void* pointer;          /**< the caller's item */
  struct H_obj_str* next; /**< null at the end of the chain */
  struct H_obj_str* prev; /**< written, never read */
  H_obj_keyType keyType;
} H_obj_str;

typedef H_obj_str Hobj;

/** A table. */
typedef struct H_table_str {
  H_obj_str** table; /**< `size` bucket heads */
  char* name;
  int32_t size;
  int32_t entries;
} H_table_str;

/** A caller's place in a table. */
typedef struct H_cursor_str {
  int32_t bucket;
  H_obj_str* obj;
} H_cursor_str;

HB_STATIC_ASSERT(sizeof(H_obj_str) == 48, "entries are 48 bytes");
HB_STATIC_ASSERT(offsetof(H_obj_str, pointer) == 16, "item after the key");
HB_STATIC_ASSERT(offsetof(H_obj_str, next) == 24, "next entry at 24");
HB_STATIC_ASSERT(offsetof(H_obj_str, prev) == 32, "previous entry at 32");
HB_STATIC_ASSERT(offsetof(H_obj_str, keyType) == 40, "key kind at 40");
HB_STATIC_ASSERT(sizeof(H_table_str) == 24, "tables are 24 bytes");

enum { H_MINIMUM_SIZE = 257 /**< fewest buckets of a table */ };

/** A new table of `size` buckets, 257 when `size` is 256 or less. Size it with prime(2 × expected entries). */
HB_API H_table_str* Hash_init(const char* name, int size);

/** `number` raised to the next one that no divisor below its square root divides; squares of primes pass. */
HB_API int prime(int number);

/** Hash of a text: its bytes exclusive-ored, every second one shifted by 8. The tables do not use it. */
HB_API int IndexHash(const char* str);

/**
 * Looks for a key. Found: bucket + 1, with the entry in `*obj`. Otherwise -(bucket + 1), with the last entry of the
 * chain in `*obj`, null for an empty bucket.
 */
HB_API int FindHashLoc(uint32_t name, H_table_str* table, H_obj_str** obj);
/** FindHashLoc() for two keys; the first alone chooses the bucket. */
HB_API int FindHashLoc2(uint32_t name, uint32_t name2, H_table_str* table, H_obj_str** obj);
/** FindHashLoc() for an address. */
HB_API int FindHashLoc_IPv6(H_IPv6_key_t* keyp, H_table_str* table, H_obj_str** obj);

/** The item under the key, or null. */
HB_API void* Hash_search(uint32_t name, H_table_str* table);
/** The item under both keys, or null. */
HB_API void* Hash_search2(uint32_t name, uint32_t name2, H_table_str* table);
/** The item under the address, or null. */
HB_API void* Hash_search_IPv6(H_IPv6_key_t* keyp, H_table_str* table);

/** Puts an item under the key. Returns the item that it replaces, or null. */
HB_API void* Hash_insert(uint32_t name, H_table_str* table, void* newitem);
/** Hash_insert() under two keys. */
HB_API void* Hash_insert2(uint32_t name, uint32_t name2, H_table_str* table, void* newitem);
/** Hash_insert() under an address. */
HB_API void* Hash_insert_IPv6(H_IPv6_key_t* keyp, H_table_str* table, void* newitem);

/** Takes the entry out and returns its item, or null. */
HB_API void* Hash_delete(uint32_t name, H_table_str* table);
/** Hash_delete() under two keys. */
HB_API void* Hash_delete2(uint32_t name, uint32_t name2, H_table_str* table);
/** Hash_delete() under an address. */
HB_API void* Hash_delete_IPv6(H_IPv6_key_t* keyp, H_table_str* table);

/** Releases the table and its entries. */
HB_API void Hash_free(H_table_str* table);

/** Releases the entries; the table stays usable. */
HB_API void Hash_clean(H_table_str* table);

/** Number of entries. */
HB_API int Hash_entries(H_table_str* table);

/** Calls `func` with every item, buckets ascending, each chain in order of insertion. Its result is ignored. */
HB_API void Hash_table_call(H_table_str* table, int (*func)(void*));

/** The first item in the order of Hash_table_call(), or null. */
HB_API void* Hash_first(H_table_str* table, H_cursor_str* cursor);
/** The item after the cursor, or null at the end and after it. */
HB_API void* Hash_next(H_table_str* table, H_cursor_str* cursor);

/** Prints the table to standard error, `df` called with every item. */
HB_API void Hash_dump_table(H_table_str* table, int (*df)(void*));

/** Prints a text item to standard error, for Hash_dump_table(); returns 0. */
HB_API int Hash_dump_string(const void* s);

HB_END_DECLS

#endif
