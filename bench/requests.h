// A request of the library against a write of as many bytes that are ready.
#pragma once

#include <functional>

#include "cluster.h"
#include "rows.h"

namespace bench {

// A request with so many bytes of data and its framing, ready to be written.
Bytes bare_request(size_t data);

// The request is sent so many times a batch, which have to fit into the socket; it has so many bytes of data.
void compare_requests(const Compare& compare, size_t batch, size_t data, const std::function<void()>& request);

}  // namespace bench
