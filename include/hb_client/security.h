/* The cluster's security keys, as the daemon publishes them. */
#ifndef HB_CLIENT_SECURITY_H
#define HB_CLIENT_SECURITY_H

#include "hb_client/types.h"

enum { HB_KEY_CACHE_SIZE = 10 /**< keys in the cache of older keys */ };

/** One unmarshalled key. `value` and `schedule` belong to the security library. */
typedef struct sec_key_desc {
  uint32_t type;
  int32_t version;
  int32_t length; /**< bytes at `value`; 0 when there is no key */
  void* value;
  void* schedule;
} sec_key_desc;

/** State of security with one key. */
typedef struct Hb_Security_Status {
  Hb_Boolean securityOn;
  int32_t keyCount;
  Hb_Boolean TRELL_compatible;
  Hb_Boolean is_valid_for_signing;
  Hb_Boolean is_valid_for_authenticating;
  sec_key_desc key;
} Hb_Security_Status;

/** Older keys that may still be met. */
typedef struct Hb_Key_Cache {
  sec_key_desc keyCache[HB_KEY_CACHE_SIZE];
  uint32_t keyCacheCount; /**< entries in use */
} Hb_Key_Cache;

HB_BEGIN_DECLS

/**
 * Number of the keys that are published: it changes with them. Starts the client when it is not running, and fails as
 * hb_init() does when that fails, with `HB_EINVAL` for a null pointer, and without an error number when no keys are
 * published, as in VEX mode.
 */
HB_API Hb_Rc hb_get_security_sequence(Hb_Sequence_Number* sequence);

/**
 * Reads the current key, the one before it, and the cache of older ones from the daemon's shared memory. (The name is
 * spelled so.)
 *
 * It fails as hb_get_security_sequence() does, and without an error number when a key cannot be unmarshalled: keys that
 * came before that one, in the order of the arguments, stand in the records, which have to be given back all the same.
 * Zero the records first, then hb_free_security_info_keys() takes them whatever happened.
 */
HB_API Hb_Rc hb_get_security_infomation(Hb_Security_Status* current, Hb_Security_Status* previous, Hb_Key_Cache* cache);

/**
 * Wipes and releases the keys that hb_get_security_infomation() filled in. Any pointer may be null. Always succeeds,
 * and does not start the client.
 */
HB_API Hb_Rc hb_free_security_info_keys(Hb_Security_Status* current, Hb_Security_Status* previous, Hb_Key_Cache* cache);

HB_END_DECLS

#endif
