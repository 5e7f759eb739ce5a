/* The segments that the daemon publishes, their keys, and the reader lock. */
#ifndef HB_PROTOCOL_SHARED_MEMORY_H
#define HB_PROTOCOL_SHARED_MEMORY_H

#include <stddef.h>
#include <stdint.h>

#include "hb_client/route.h"
#include "hb_client/security.h"
#include "hb_client/types.h"

/* Project ids for ftok() on the daemon's resolved socket path. */
enum {
  HB_CONFIGURATION_SEGMENT_ID = 103, /**< 'g' */
  HB_ROUTE_SEGMENT_ID = 104,         /**< 'h' */
  HB_SEMAPHORE_SET_ID = 105,         /**< 'i' */
  HB_SECURITY_SEGMENT_ID = 112       /**< 'p' */
};

/*
 * The reader lock. A reader enters with one semop of two operations, readers += 1 and wait until writer is 0, and
 * leaves with readers -= 1. The writer sets writer, waits until readers is 0, writes, and clears writer. All of it with
 * SEM_UNDO, so that a process that dies leaves no hold.
 */
enum {
  HB_READERS_SEMAPHORE = 0, /**< number of readers inside */
  HB_WRITER_SEMAPHORE = 1,  /**< non-zero while the daemon rewrites the segments */
  HB_SEMAPHORE_COUNT = 2
};

/** Configuration segment. */
typedef struct memory_configuration_data {
  Hb_Sequence_Number sequence_number; /**< stamp of the current publication; 0: nothing valid is published */
  uint32_t number_of_nodes;           /**< entries of the route segment */
  uint32_t number_of_adapters;        /**< adapters of the configuration */
} memory_configuration_data;

typedef memory_configuration_data Hb_memory_configuration_data;

/** One entry of the route segment, which has one for each node number. */
typedef struct route_sequence {
  Hb_Sequence_Number sequence_number; /**< current only while it equals the configuration segment's and is not 0 */
  uint16_t length;                    /**< length of the source route option */
  uint16_t nonip;                     /**< non-zero when the route is not an IP route */
  Hb_Source_Route ip_option;
} route_sequence;

typedef route_sequence Hb_route_sequence;

enum { HB_STORED_KEY_SIZE = 256 /**< most bytes of a stored key */ };

/** A stored key. */
typedef struct Hb_sec_buffer_desc {
  int32_t length; /**< bytes used of `value`; 0: no key */
  uint8_t value[HB_STORED_KEY_SIZE];
} Hb_sec_buffer_desc;

typedef struct Hb_Shared_Security_Status {
  Hb_Boolean securityOn;
  int32_t keyCount;
  Hb_Boolean TRELL_compatible;
  Hb_Boolean is_valid_for_signing;
  Hb_Boolean is_valid_for_authenticating;
  Hb_sec_buffer_desc key;
} Hb_Shared_Security_Status;

typedef struct Hb_Shared_Key_Cache {
  Hb_sec_buffer_desc keyCache[HB_KEY_CACHE_SIZE];
  uint32_t keyCacheCount; /**< entries in use */
} Hb_Shared_Key_Cache;

/** Security segment. It is read without the reader lock. */
typedef struct security_information {
  Hb_Sequence_Number sequence_number;
  Hb_Shared_Security_Status previous_sec_status;
  Hb_Shared_Security_Status current_sec_status;
  Hb_Shared_Key_Cache cache;
} security_information;

typedef security_information Hb_security_information;

HB_STATIC_ASSERT(sizeof(memory_configuration_data) == 12, "configuration segment is 12 bytes");
HB_STATIC_ASSERT(offsetof(memory_configuration_data, number_of_nodes) == 4, "number of nodes at 4");
HB_STATIC_ASSERT(offsetof(memory_configuration_data, number_of_adapters) == 8, "number of adapters at 8");
HB_STATIC_ASSERT(sizeof(route_sequence) == 184, "routes are 184 bytes");
HB_STATIC_ASSERT(offsetof(route_sequence, length) == 4, "length at 4");
HB_STATIC_ASSERT(offsetof(route_sequence, nonip) == 6, "non-IP marker at 6");
HB_STATIC_ASSERT(offsetof(route_sequence, ip_option) == 8, "route at 8");
HB_STATIC_ASSERT(sizeof(Hb_sec_buffer_desc) == 260, "stored keys are 260 bytes");
HB_STATIC_ASSERT(offsetof(Hb_sec_buffer_desc, value) == 4, "key bytes at 4");
HB_STATIC_ASSERT(sizeof(Hb_Shared_Security_Status) == 280, "security states are 280 bytes");
HB_STATIC_ASSERT(offsetof(Hb_Shared_Security_Status, keyCount) == 4, "key count at 4");
HB_STATIC_ASSERT(offsetof(Hb_Shared_Security_Status, TRELL_compatible) == 8, "compatibility at 8");
HB_STATIC_ASSERT(offsetof(Hb_Shared_Security_Status, is_valid_for_signing) == 12, "signing at 12");
HB_STATIC_ASSERT(offsetof(Hb_Shared_Security_Status, is_valid_for_authenticating) == 16, "authenticating at 16");
HB_STATIC_ASSERT(offsetof(Hb_Shared_Security_Status, key) == 20, "key at 20");
HB_STATIC_ASSERT(sizeof(Hb_Shared_Key_Cache) == 2604, "the key cache is 2,604 bytes");
HB_STATIC_ASSERT(offsetof(Hb_Shared_Key_Cache, keyCacheCount) == 2600, "cache count at 2600");
HB_STATIC_ASSERT(sizeof(security_information) == 3168, "security segment is 3,168 bytes");
HB_STATIC_ASSERT(offsetof(security_information, previous_sec_status) == 4, "previous state at 4");
HB_STATIC_ASSERT(offsetof(security_information, current_sec_status) == 284, "current state at 284");
HB_STATIC_ASSERT(offsetof(security_information, cache) == 564, "cache at 564");

#endif
