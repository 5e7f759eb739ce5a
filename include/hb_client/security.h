/* Records of the security family: keys as a caller holds them. */
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

#endif
