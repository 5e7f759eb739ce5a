/* libzu_mss: typed keys. */
#ifndef ZU_MSS_H
#define ZU_MSS_H

#include <stdint.h>

#include "hb_client/security.h"

#ifdef __cplusplus
extern "C" {
#endif

/** A marshalled key, which belongs to the caller. */
typedef struct sec_buffer {
  int32_t length;
  const void* value;
} sec_buffer;

/**
 * Unmarshals a typed key into memory of its own.
 *
 * @param buffer the marshalled key: type (4 bytes), version (4), length (4), all little-endian, then as many bytes of
 *   value; together at most 256 bytes and exactly `buffer->length`.
 * @param key filled on success; all zero on failure. Give it back with sec_release_typed_key().
 * @return 0, or -1 when the key is malformed, an argument is null or memory runs out.
 */
int sec_unmarshal_typed_key(const sec_buffer* buffer, sec_key_desc* key);

/** Wipes and releases what the key holds and zeroes the record; a record that holds nothing is left alone. */
void sec_release_typed_key(sec_key_desc* key);

#ifdef __cplusplus
}
#endif

#endif
