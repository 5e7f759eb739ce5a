// The security keys that the daemon publishes, handed out as unmarshalled keys of the caller's.
#include <strings.h>

#include <cstring>
#include <initializer_list>

#include "argument_check.h"
#include "hb_client/security.h"
#include "hb_protocol/shared_memory.h"
#include "zu_mss.h"

namespace {

// A copy of something published that may hold keys: the daemon may rewrite it at any time, and nothing of it stays.
template <typename Record>
class Copy {
 public:
  explicit Copy(const Record& published) { std::memcpy(&record_, &published, sizeof record_); }
  ~Copy() { explicit_bzero(&record_, sizeof record_); }
  Copy(const Copy&) = delete;
  Copy& operator=(const Copy&) = delete;

  const Record* operator->() const { return &record_; }
  const Record& operator*() const { return record_; }

 private:
  Record record_;
};

bool has_stored_size(const Hb_sec_buffer_desc& stored) {
  return stored.length > 0 && stored.length <= HB_STORED_KEY_SIZE;
}

// Fills the key, with zeros when none is stored. A failure releases what there is of it.
Hb_Rc unmarshal(const Hb_sec_buffer_desc& stored, sec_key_desc& key) {
  key = {};
  if (stored.length == 0) {
    return Hb_Success;
  }
  const sec_buffer marshalled = {stored.length, stored.value};
  if (has_stored_size(stored) && sec_unmarshal_typed_key(&marshalled, &key) == 0) {
    return Hb_Success;
  }
  sec_release_typed_key(&key);
  return Hb_Failure;
}

Hb_Rc read_status(const Hb_Shared_Security_Status& published, Hb_Security_Status& status) {
  const Copy<Hb_Shared_Security_Status> copy(published);
  status.securityOn = copy->securityOn;
  status.keyCount = copy->keyCount;
  status.TRELL_compatible = copy->TRELL_compatible;
  status.is_valid_for_signing = copy->is_valid_for_signing;
  status.is_valid_for_authenticating = copy->is_valid_for_authenticating;
  return unmarshal(copy->key, status.key);
}

Hb_Rc read_cache(const Hb_Shared_Key_Cache& published, Hb_Key_Cache& cache) {
  for (int i = 0; i < HB_KEY_CACHE_SIZE; ++i) {
    if (unmarshal(*Copy<Hb_sec_buffer_desc>(published.keyCache[i]), cache.keyCache[i]) != Hb_Success) {
      return Hb_Failure;
    }
  }
  cache.keyCacheCount = published.keyCacheCount;
  return Hb_Success;
}

void release(sec_key_desc& key) {
  if (key.length != 0 && key.value != nullptr) {
    sec_release_typed_key(&key);
  }
}

}  // namespace

Hb_Rc hb_get_security_sequence(Hb_Sequence_Number* sequence) {
  if (start_with(sequence) != Hb_Success || security_info == nullptr) {
    return Hb_Failure;
  }
  *sequence = security_info->sequence_number;
  return Hb_Success;
}

Hb_Rc hb_get_security_infomation(Hb_Security_Status* current, Hb_Security_Status* previous, Hb_Key_Cache* cache) {
  if (start_with(current, previous, cache) != Hb_Success || security_info == nullptr) {
    return Hb_Failure;
  }
  if (read_status(security_info->current_sec_status, *current) != Hb_Success ||
      read_status(security_info->previous_sec_status, *previous) != Hb_Success) {
    return Hb_Failure;
  }
  return read_cache(security_info->cache, *cache);
}

Hb_Rc hb_free_security_info_keys(Hb_Security_Status* current, Hb_Security_Status* previous, Hb_Key_Cache* cache) {
  for (Hb_Security_Status* status : {current, previous}) {
    if (status != nullptr) {
      release(status->key);
    }
  }
  if (cache != nullptr) {
    for (sec_key_desc& key : cache->keyCache) {
      release(key);
    }
  }
  return Hb_Success;
}
