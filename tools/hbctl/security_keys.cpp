#include "security_keys.h"

#include "errors.h"

namespace hbctl {
namespace {

// A daemon that changes its keys more often than they can be read is not waited for.
constexpr int kAttempts = 100;

Hb_Sequence_Number read_sequence() {
  Hb_Sequence_Number sequence = 0;
  if (hb_get_security_sequence(&sequence) != Hb_Success) {
    throw CommandError(ExitStatus::Failed,
                       "cannot read the security keys: none are published (the library gives no error number)");
  }
  return sequence;
}

}  // namespace

SecurityKeys::SecurityKeys() {
  try {
    read_of_one_publication();
  } catch (...) {
    release();
    throw;
  }
}

SecurityKeys::~SecurityKeys() { release(); }

void SecurityKeys::read_of_one_publication() {
  for (int attempt = 0; attempt < kAttempts; ++attempt) {
    sequence_ = read_sequence();
    read();
    if (read_sequence() == sequence_) return;
    release();
  }
  throw CommandError(ExitStatus::Failed, "cannot read the security keys: they change all the time\ntry again");
}

void SecurityKeys::read() {
  if (hb_get_security_infomation(&current_, &previous_, &cache_) == Hb_Success) return;
  throw CommandError(ExitStatus::Failed,
                     "cannot read the security keys: one of them is malformed (the library gives no error number)\n"
                     "have the daemon change its keys, or start it again");
}

void SecurityKeys::release() { hb_free_security_info_keys(&current_, &previous_, &cache_); }

}  // namespace hbctl
