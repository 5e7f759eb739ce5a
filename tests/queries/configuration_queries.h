// The queries against the sparse cluster.
#pragma once

#include "platform_doubles.h"
#include "test_cluster.h"

namespace hb_test {

class ConfigurationQueries : public Loaded_Client {
 protected:
  ~ConfigurationQueries() override { trace_nothing(); }
};

}  // namespace hb_test
