#include "hb_communication/shared_memory.h"

#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>

#include <cerrno>
#include <cstddef>
#include <cstdint>

#include "hb_communication/connection.h"

namespace {

struct Errno_Mapping {
  int system_error;
  int library_error;
};

constexpr Errno_Mapping configuration_get_errors[] = {
    {EACCES, HB_ESHMGET_ACCESS}, {EINVAL, HB_ESHMGET_INVAL}, {ENOENT, HB_ESHMGET_NOENT},
    {ENOMEM, HB_ESHMGET_NOMEM},  {ENOSPC, HB_ESHMGET_LIMIT},
};

// The limit that these two report is another one than above; callers depend on it.
constexpr Errno_Mapping other_get_errors[] = {
    {EACCES, HB_ESHMGET_ACCESS}, {EINVAL, HB_ESHMGET_INVAL}, {ENOENT, HB_ESHMGET_NOENT},
    {ENOMEM, HB_ESHMGET_NOMEM},  {EMFILE, HB_ESHMGET_LIMIT},
};

constexpr Errno_Mapping attach_errors[] = {
    {EACCES, HB_ESHMAT_ACCESS},
    {EINVAL, HB_ESHMAT_INVAL},
    {ENOENT, HB_ESHMAT_NOENT},
    {ENOMEM, HB_ESHMAT_NOMEM},
};

constexpr Errno_Mapping semaphore_errors[] = {
    {ENOENT, HB_ESEMGET_NOENT}, {ENOMEM, HB_ESEMGET_NOMEM}, {EACCES, HB_ESEMGET_ACCESS},
    {EINVAL, HB_ESEMGET_INVAL}, {ENOSPC, HB_ESEMGET_NOSPC},
};

template <size_t N>
Hb_Rc fail_by_errno(const Errno_Mapping (&mapping)[N], int otherwise) {
  for (const Errno_Mapping& entry : mapping) {
    if (entry.system_error == errno) {
      return fail(entry.library_error);
    }
  }
  return fail(otherwise);
}

struct Keys {
  key_t configuration;
  key_t route;
  key_t security;
  key_t semaphores;
};

bool make_key(int project_id, key_t& key) {
  key = ftok(SERVER_SOCK_FNAME, project_id);
  return key != -1;
}

Hb_Rc make_keys(Keys& keys) {
  if (!make_key(HB_CONFIGURATION_SEGMENT_ID, keys.configuration)) {
    return fail(HB_EKEY_CONFIG);
  }
  if (!make_key(HB_ROUTE_SEGMENT_ID, keys.route)) {
    return fail(HB_EKEY_ROUTE);
  }
  if (!make_key(HB_SECURITY_SEGMENT_ID, keys.security)) {
    return fail(HB_EKEY_SECURITY);
  }
  if (!make_key(HB_SEMAPHORE_SET_ID, keys.semaphores)) {
    return fail(HB_EKEY_SEM);
  }
  return Hb_Success;
}

bool is_attached(const void* address) { return address != nullptr && reinterpret_cast<intptr_t>(address) != -1; }

template <typename Segment, size_t N>
Hb_Rc attach(key_t key, size_t size, const Errno_Mapping (&get_errors)[N], int& id, Segment*& segment) {
  id = shmget(key, size, 0);
  if (size == 0) {
    // Systems differ in whether they refuse this for a segment that exists; nothing of no size can be read.
    id = -1;
    errno = EINVAL;
  }
  if (id == -1) {
    return fail_by_errno(get_errors, HB_ESHMGET);
  }
  void* address = shmat(id, nullptr, SHM_RDONLY);
  if (!is_attached(address)) {
    segment = nullptr;
    return fail_by_errno(attach_errors, HB_ESHMAT);
  }
  segment = static_cast<Segment*>(address);
  return Hb_Success;
}

void detach(const void* segment) {
  if (is_attached(segment)) {
    shmdt(segment);
  }
}

}  // namespace

Hb_Rc hb_init_shared_memory() {
  Keys keys = {};
  if (make_keys(keys) != Hb_Success || attach(keys.configuration, sizeof *data_for_client, configuration_get_errors,
                                              shm_id[0], data_for_client) != Hb_Success) {
    return Hb_Failure;
  }
  const uint32_t routes = data_for_client->number_of_nodes;
  const size_t route_size = size_t{routes} * sizeof *shared_route_info;
  if (attach(keys.route, route_size, other_get_errors, shm_id[1], shared_route_info) != Hb_Success) {
    return Hb_Failure;
  }
  attached_routes = shared_route_info;
  attached_route_count = routes;
  if (attach(keys.security, sizeof *security_info, other_get_errors, shm_id[2], security_info) != Hb_Success) {
    return Hb_Failure;
  }
  shm_sem_id = semget(keys.semaphores, HB_SEMAPHORE_COUNT, 0);
  return shm_sem_id != -1 ? Hb_Success : fail_by_errno(semaphore_errors, HB_ESEMGET);
}

void hb_detach_shared_memory() {
  detach(data_for_client);
  detach(shared_route_info);
  detach(security_info);
  data_for_client = nullptr;
  shared_route_info = nullptr;
  attached_routes = nullptr;
  attached_route_count = 0;
  security_info = nullptr;
}
