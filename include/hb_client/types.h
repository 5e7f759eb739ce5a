/* Types that every family of the library shares: results, truth values, numbers, names and addresses. */
#ifndef HB_CLIENT_TYPES_H
#define HB_CLIENT_TYPES_H

#include <netinet/in.h>
#include <stdint.h>
#include <sys/time.h>

/* Marks what the shared library exports; everything else in it is hidden. */
#define HB_API __attribute__((visibility("default")))

/*
 * Enumerations are 4 bytes in every interface. In C++ their underlying type is fixed, so that a value which
 * came from another process or from a caller is data even when no enumerator has it.
 */
#ifdef __cplusplus
#define HB_ENUM_BASE : int32_t
#define HB_BEGIN_DECLS extern "C" {
#define HB_END_DECLS }
#define HB_STATIC_ASSERT(condition, text) static_assert(condition, text)
#else
#define HB_ENUM_BASE
#define HB_BEGIN_DECLS
#define HB_END_DECLS
#define HB_STATIC_ASSERT(condition, text) _Static_assert(condition, text)
#endif

/** Result of every operation. Never 0 or 1: compare with the names. */
typedef enum Hb_Rc HB_ENUM_BASE {
  Hb_Success = 2,
  Hb_Failure = 3,
} Hb_Rc;

/** Truth value. A record filled elsewhere may hold any 32-bit value; only `Hb_True` means true. */
typedef enum Hb_Boolean HB_ENUM_BASE {
  Hb_False = 0,
  Hb_True = 1,
} Hb_Boolean;

/** State of a node, an adapter or a site. */
typedef enum Hb_Entity_State HB_ENUM_BASE {
  Hb_Entity_Undef = 0,
  Hb_Entity_Up = 1,
  Hb_Entity_Down = 2,
} Hb_Entity_State;

/** Why a node is in its state. */
typedef enum Hb_Entity_State_Reason HB_ENUM_BASE {
  Hb_Entity_State_Reason_Down = 0,
  Hb_Entity_State_Reason_Up = 1,
  Hb_Entity_State_Reason_BRIXD_Down = 2,
  Hb_Entity_State_Reason_BRIXD_Up = 3,
  Hb_Entity_State_Reason_LOCAL_SPLIT_Down = 4,
  Hb_Entity_State_Reason_REMOTE_SPLIT_Down = 5,
  Hb_Entity_State_Reason_LINK_Down = 6,
  Hb_Entity_State_Reason_SHUT_Down = 7,
  Hb_Entity_State_Reason_FORCE_Down = 8,
  Hb_Entity_State_Reason_STOPPED_Down = 9,
  Hb_Entity_State_Reason_Undef = 10,
} Hb_Entity_State_Reason;

/** Whether the members of a group agree on it. */
typedef enum Hb_Group_Status HB_ENUM_BASE {
  Hb_Group_Stable = 0,
  Hb_Group_Unstable = 1,
} Hb_Group_Status;

typedef int16_t Hb_Node_Number;      /**< 0 up to the cluster's maximum; `HB_NO_NODE` means none */
typedef uint32_t Hb_Adapter_Number;  /**< node number × adapters per node + index within the node */
typedef int16_t Hb_Network_Number;   /**< index into the network list; `HB_NO_NETWORK` means none */
typedef uint16_t Hb_Site_Number;     /**< `HB_NO_SITE` means none */
typedef int32_t Hb_Cursor;           /**< position of an iteration; changed by first and next calls only */
typedef uint32_t Hb_Incarnation;     /**< incarnation of a group or of a member */
typedef uint32_t Hb_Seq_Num;         /**< number of an event or of a heartbeat */
typedef uint32_t Hb_Sequence_Number; /**< number of a publication in shared memory */
typedef uint32_t Hb_Config_Instance; /**< configuration instance */
typedef uint32_t Hb_IP_address4;     /**< IPv4 address in network byte order */
typedef int32_t Hb_Events;           /**< set of event bits, see hb_client/events.h */

#define HB_NO_NODE ((Hb_Node_Number)-1)
#define HB_NO_ADAPTER ((Hb_Adapter_Number)0xFFFFFFFFU)
#define HB_NO_NETWORK ((Hb_Network_Number)-1)
#define HB_NO_SITE ((Hb_Site_Number)65535)

enum {
  HB_MAX_NODES = 2049,         /**< node numbers are below this in every cluster */
  HB_MAX_NETWORKS = 48,        /**< network slots, and the most adapters that a node can have a slot for */
  HB_MAX_ADAPTERS = 98352,     /**< adapter numbers are below this in every cluster */
  HB_MAX_SITES = 2,            /**< sites that the library keeps a flag for */
  HB_NAME_LENGTH = 32,         /**< bytes of `Hb_Name`, terminator included */
  HB_ADAPTER_TYPE_LENGTH = 36, /**< bytes of `Hb_Adapter_Type`, terminator included */
  HB_NETWORK_NAME_LENGTH = 70, /**< bytes of `Hb_Network_Name`, terminator included */
  HB_NETWORK_TYPE_LENGTH = 16, /**< bytes of `Hb_Network_Type`, terminator included */
  HB_FFDC_ID_LENGTH = 43       /**< bytes of a failure-data identifier, terminator included */
};

typedef char Hb_Name[HB_NAME_LENGTH];                 /**< NUL-terminated name of a subscription */
typedef char Hb_Adapter_Type[HB_ADAPTER_TYPE_LENGTH]; /**< NUL-terminated type or interface name of an adapter */
typedef char Hb_Network_Name[HB_NETWORK_NAME_LENGTH]; /**< NUL-terminated; empty marks an unused network slot */
typedef char Hb_Network_Type[HB_NETWORK_TYPE_LENGTH]; /**< NUL-terminated type of a network */
typedef char fc_eid_t[HB_FFDC_ID_LENGTH];             /**< failure-data identifier on the wire */
typedef char Hb_FFDC_Id[HB_FFDC_ID_LENGTH];           /**< failure-data identifier, empty when there is none */

/** A 16-byte address. An IPv4 address is held IPv4-mapped: words 0, 0, htonl(0xFFFF), the address. */
typedef union Hb_IP_address6 {
  struct in6_addr i6_ipv6;
  struct {
    uint32_t filler[3];
    Hb_IP_address4 v4_in_v6_ipv4;
  } v4_in_v6;
} Hb_IP_address6;

typedef int32_t zu_int32_t;

/** Time in two 32-bit fields, as the daemon's packets carry it. */
typedef struct zu_timeval32 {
  int32_t tv_sec;  /**< seconds */
  int32_t tv_usec; /**< microseconds */
} zu_timeval32;

HB_STATIC_ASSERT(sizeof(Hb_Rc) == 4, "results are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Boolean) == 4, "truth values are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Entity_State) == 4, "entity states are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Entity_State_Reason) == 4, "state reasons are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Group_Status) == 4, "group states are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Node_Number) == 2 && (Hb_Node_Number)-1 < 0, "node numbers are signed, 2 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Adapter_Number) == 4 && (Hb_Adapter_Number)-1 > 0, "adapter numbers are unsigned, 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Network_Number) == 2 && (Hb_Network_Number)-1 < 0, "network numbers are signed, 2 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Site_Number) == 2 && (Hb_Site_Number)-1 > 0, "site numbers are unsigned, 2 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Cursor) == 4 && (Hb_Cursor)-1 < 0, "cursors are signed, 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Incarnation) == 4 && (Hb_Incarnation)-1 > 0, "incarnations are unsigned, 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Seq_Num) == 4 && (Hb_Seq_Num)-1 > 0, "event numbers are unsigned, 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Config_Instance) == 4 && (Hb_Config_Instance)-1 > 0, "instances are unsigned, 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_IP_address4) == 4 && (Hb_IP_address4)-1 > 0, "IPv4 addresses are unsigned, 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_IP_address6) == 16, "addresses are 16 bytes");
HB_STATIC_ASSERT(sizeof(zu_timeval32) == 8, "short times are 8 bytes");

#endif
