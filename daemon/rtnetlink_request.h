/* Requests to the kernel that change links and addresses. */
#ifndef HBD_RTNETLINK_REQUEST_H
#define HBD_RTNETLINK_REQUEST_H

#include <string>

#include "host_table.h"

namespace hbd {

/** Each yields 0, or the error number that the kernel answers. */
int switch_link(int interface, bool on);
int add_address(const HostAddress& address);
int remove_address(const HostAddress& address);

}  // namespace hbd

#endif
