// Threads that are cancelled while they have the mutex of the two global interface lists.
#include <pthread.h>

#include <thread>

#include "table_state.h"

namespace {

// Whether this thread looks for its cancellation before it releases a mutex.
thread_local bool is_cancelled_inside = false;

}  // namespace

extern "C" {
// Of AddressSanitizer, where it is in. It does not see a thread's stack go by cancellation unless it is told.
[[gnu::weak]] void __asan_handle_no_return();

int __real_pthread_mutex_unlock(pthread_mutex_t* mutex);
int __wrap_pthread_mutex_unlock(pthread_mutex_t* mutex);
int __wrap_pthread_mutex_unlock(pthread_mutex_t* mutex) {
  if (is_cancelled_inside && mutex == &global_boot_ip_list_mutex) {
    is_cancelled_inside = false;
    pthread_cancel(pthread_self());
    if (__asan_handle_no_return != nullptr) __asan_handle_no_return();
    pthread_testcancel();
  }
  return __real_pthread_mutex_unlock(mutex);
}
}

namespace hb_test {
namespace {

zu_vex_net_intf_info_t* output = nullptr;

struct Section {
  const char* description;
  void (*run)();
};

class CancelledInside : public TableState, public testing::WithParamInterface<Section> {
 protected:
  CancelledInside() {
    trace_nothing();
    scripted_cluster().boot_addresses = {interface_of(1, "en0", 0)};
    scripted_cluster().interfaces = {interface_of(1, "en0", 0)};
    hb_refresh_boot_ip_addrs(&output);
    zu_vex_free_net_intf_info(output);
    output = nullptr;
  }
  ~CancelledInside() override {
    hb_free_net_intf_copies(global_vex_net_intf_tbl);
    global_vex_net_intf_tbl = nullptr;
    zu_vex_free_net_intf_info(global_boot_ip_list);
    global_boot_ip_list = nullptr;
  }

  // Runs the section on a thread that is cancelled before it releases the mutex. Yields whether it was.
  static bool run_cancelled(void (*section)()) {
    pthread_t thread;
    if (pthread_create(&thread, nullptr, be_cancelled, reinterpret_cast<void*>(section)) != 0) return false;
    void* result = nullptr;
    return pthread_join(thread, &result) == 0 && result == PTHREAD_CANCELED;
  }

  static bool is_mutex_free() {
    bool is_free = false;
    std::thread([&is_free] {
      is_free = pthread_mutex_trylock(&global_boot_ip_list_mutex) == 0;
      if (is_free) pthread_mutex_unlock(&global_boot_ip_list_mutex);
    }).join();
    return is_free;
  }

 private:
  static void* be_cancelled(void* section) {
    is_cancelled_inside = true;
    reinterpret_cast<void (*)()>(section)();
    return nullptr;
  }
};

TEST_P(CancelledInside, LeavesTheMutexFreeAndTheListsUsable) {
  const LeakAllowed tables_stay;  // of new interfaces the table before them stays allocated
  EXPECT_TRUE(run_cancelled(GetParam().run));
  ASSERT_TRUE(is_mutex_free());
  EXPECT_EQ(output, nullptr);
  EXPECT_EQ(Scripted_Cluster::outstanding(), 1U);  // the boot list
  zu_vex_IP_address6_t boot = scripted_address(1, 1, 0);
  EXPECT_EQ(hb_check_if_in_global_boot_ip_list(1, "en0", &boot), Hb_True);
  ASSERT_NE(global_vex_net_intf_tbl, nullptr);
  EXPECT_STREQ(global_vex_net_intf_tbl->p_name, "en0");
}

INSTANTIATE_TEST_SUITE_P(Sections, CancelledInside,
                         testing::Values(Section{"Search",
                                                 [] { hb_check_if_in_global_boot_ip_list(1, "en0", nullptr); }},
                                         Section{"Refresh", [] { hb_refresh_boot_ip_addrs(&output); }}),
                         [](const auto& test) { return test.param.description; });

}  // namespace
}  // namespace hb_test
