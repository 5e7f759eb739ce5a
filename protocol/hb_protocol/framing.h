/* Framing of the stream between client and daemon: a 4-byte length in host byte order, then that many bytes. */
#ifndef HB_PROTOCOL_FRAMING_H
#define HB_PROTOCOL_FRAMING_H

#include <stdint.h>

/** Length that stands before each packet, in both directions. It counts the packet only, not itself. */
typedef int32_t hb_frame_length;

enum {
  HB_FRAME_PREFIX_SIZE = 4,      /**< bytes of the length */
  HB_SOCKET_BUFFER_SIZE = 32768, /**< send and receive buffer of the client's end */
  HB_SOCKET_PATH_SIZE = 108      /**< bytes of a socket path, terminator included */
};

/* Where the daemon listens, and what changes it. */
#define HB_DEFAULT_SERVER_SOCKET "/var/ha/soc/mowl/server_socket"
#define HB_SERVER_SOCKET_VARIABLE "HB_SERVER_SOCKET" /* replaces the path, also when empty */
#define HB_DOMAIN_VARIABLE "HA_DOMAIN_NAME"          /* appended after a dot when not empty */
#define HB_PARTITION_VARIABLE "HA_SYSPAR_NAME"       /* the same, when there is no domain */

#endif
