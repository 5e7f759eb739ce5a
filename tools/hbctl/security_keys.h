// The keys that the daemon publishes, held only for as long as they are shown.
#pragma once

#include "hb_client/security.h"

namespace hbctl {

class SecurityKeys {
 public:
  // Reads keys of one publication. Throws CommandError.
  SecurityKeys();
  // Wipes them.
  ~SecurityKeys();
  SecurityKeys(const SecurityKeys&) = delete;
  SecurityKeys& operator=(const SecurityKeys&) = delete;

  Hb_Sequence_Number sequence() const { return sequence_; }
  const Hb_Security_Status& current() const { return current_; }
  const Hb_Security_Status& previous() const { return previous_; }
  const Hb_Key_Cache& cache() const { return cache_; }

 private:
  void read();
  void read_of_one_publication();
  void release();

  Hb_Sequence_Number sequence_ = 0;
  Hb_Security_Status current_{};
  Hb_Security_Status previous_{};
  Hb_Key_Cache cache_{};
};

}  // namespace hbctl
