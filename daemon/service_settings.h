/* How the daemon serves its clients, whatever the cluster is. */
#ifndef HBD_SERVICE_SETTINGS_H
#define HBD_SERVICE_SETTINGS_H

#include <chrono>
#include <string>

namespace hbd {

/** Settings of the service. */
struct ServiceSettings {
  std::chrono::milliseconds stale_age{10000};      /**< events are stale from this age on */
  std::chrono::milliseconds reader_patience{1000}; /**< a reader that is longer in the segments is reported */
  std::string key_file;                            /**< where the security key is; empty: it is made at random */
  std::chrono::milliseconds key_rotation{0};       /**< time between two keys; 0: for ever */
};

}  // namespace hbd

#endif
