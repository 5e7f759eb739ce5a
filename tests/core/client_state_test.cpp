// The process-wide state before a start, the two mutexes, and the trace registration.
#include "hb_global_data/state.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pthread.h>

#include <string>
#include <thread>
#include <vector>

#include "VEX_HBC_trace.h"
#include "hb_global_data/start_up.h"
#include "hb_global_data/vex_event_queue.h"
#include "platform_doubles.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

// Before anything ran.

TEST(State, HasTheSizesOfItsTables) {
  EXPECT_EQ(sizeof global_node_tbl, 2049U * 4);
  EXPECT_EQ(sizeof global_site_tbl, 2U * 4);
  EXPECT_EQ(sizeof shm_id, 3U * 4);
  EXPECT_EQ(sizeof nodeEventSubscriptionName, 32U);
  EXPECT_EQ(sizeof networkEventSubscriptionName, 32U);
  EXPECT_EQ(sizeof event_sequence, 4U);
}

TEST(State, IsEmptyAndInDaemonModeBeforeTheFirstStart) {
  EXPECT_EQ(IsVEX, Hb_False);
  EXPECT_EQ(client_initialized, Hb_False);
  EXPECT_EQ(data_for_client, nullptr);
  EXPECT_EQ(shared_route_info, nullptr);
  EXPECT_EQ(security_info, nullptr);
  EXPECT_EQ(event_queue_list, nullptr);
  EXPECT_EQ(global_boot_ip_list, nullptr);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
  EXPECT_EQ(global_config_tbl.adap_hash, nullptr);
  EXPECT_EQ(global_config_tbl_new.adap_hash, nullptr);
  EXPECT_EQ(global_num_nodes, 0);
  EXPECT_EQ(global_num_sites, 0);
  EXPECT_STREQ(nodeEventSubscriptionName, "");
  EXPECT_STREQ(networkEventSubscriptionName, "");
  EXPECT_STREQ(siteEventSubscriptionName, "");
  EXPECT_STREQ(splitMergeEventSubscriptionName, "");
}

TEST(State, HasNoMonitorHandlerBeforeTheFirstStart) {
  EXPECT_EQ(adapter_event_handler_p, nullptr);
  EXPECT_EQ(event_pipe_handler_p, nullptr);
  EXPECT_EQ(ip_change_handler_p, nullptr);
  EXPECT_EQ(new_group_event_handler_p, nullptr);
  EXPECT_EQ(node_list_handler_p, nullptr);
  EXPECT_EQ(node_liveness_handler_p, nullptr);
  EXPECT_EQ(peer_GS_liveness_handler_p, nullptr);
  EXPECT_EQ(cluster_reconfig_handler_p, nullptr);
  EXPECT_EQ(site_config_handler_p, nullptr);
  EXPECT_EQ(split_merge_handler_p, nullptr);
  EXPECT_EQ(evmon_cluster_name, nullptr);
}

// The mutexes.

class Mutexes : public testing::Test {
 protected:
  Mutexes() { platform_double().reset(); }

  std::vector<std::string> assertion_texts() {
    std::vector<std::string> texts;
    for (const Recorded_Assertion& assertion : platform_double().assertions) {
      EXPECT_EQ(assertion.file, "lib/hb_global_data");
      EXPECT_GT(assertion.line, 0);
      texts.push_back(assertion.text);
    }
    return texts;
  }

  // Whether another thread can have it now.
  static bool is_free(pthread_mutex_t& mutex) {
    bool taken = false;
    std::thread([&] {
      taken = pthread_mutex_trylock(&mutex) == 0;
      if (taken) {
        pthread_mutex_unlock(&mutex);
      }
    }).join();
    return taken;
  }
};

TEST_F(Mutexes, AreBothMadeRecursiveBootAddressesFirst) {
  SystemCalls calls;
  hbapi_global_data_once_init();
  EXPECT_THAT(calls.sequence(), ElementsAre("pthread_mutexattr_init", "pthread_mutexattr_settype", "pthread_mutex_init",
                                            "pthread_mutex_init", "pthread_mutexattr_destroy"));
  EXPECT_EQ(calls.of("pthread_mutexattr_settype")[0].arguments[1], PTHREAD_MUTEX_RECURSIVE);
  EXPECT_EQ(calls.of("pthread_mutex_init")[0].arguments[0], reinterpret_cast<intptr_t>(&global_boot_ip_list_mutex));
  EXPECT_EQ(calls.of("pthread_mutex_init")[1].arguments[0],
            reinterpret_cast<intptr_t>(&event_queue_list_and_sequence_mutex));
  EXPECT_TRUE(platform_double().assertions.empty());
}

TEST_F(Mutexes, MayBeLockedTwiceByOneThread) {
  hbapi_global_data_once_init();
  for (pthread_mutex_t* mutex : {&global_boot_ip_list_mutex, &event_queue_list_and_sequence_mutex}) {
    ASSERT_EQ(pthread_mutex_lock(mutex), 0);
    EXPECT_EQ(pthread_mutex_trylock(mutex), 0);
    EXPECT_FALSE(is_free(*mutex));
    EXPECT_EQ(pthread_mutex_unlock(mutex), 0);
    EXPECT_FALSE(is_free(*mutex));
    EXPECT_EQ(pthread_mutex_unlock(mutex), 0);
    EXPECT_TRUE(is_free(*mutex));
  }
}

TEST_F(Mutexes, FailureToMakeTheAttributeIsAsserted) {
  {
    SystemCalls calls;
    calls.script("pthread_mutexattr_init", {result(12)});
    calls.script("pthread_mutexattr_settype", {result(0)});
    calls.always("pthread_mutex_init", result(0));
    calls.script("pthread_mutexattr_destroy", {result(0)});
    hbapi_global_data_once_init();
  }
  EXPECT_THAT(assertion_texts(), ElementsAre("pthread_mutexattr_init(&new_mutex_attrs) == 0"));
}

TEST_F(Mutexes, FailureToSetTheTypeIsAsserted) {
  {
    SystemCalls calls;
    calls.script("pthread_mutexattr_settype", {result(22)});
    hbapi_global_data_once_init();
  }
  EXPECT_THAT(assertion_texts(),
              ElementsAre("pthread_mutexattr_settype(&new_mutex_attrs, PTHREAD_MUTEX_RECURSIVE) == 0"));
}

TEST_F(Mutexes, FailureToMakeTheBootAddressMutexIsAsserted) {
  {
    SystemCalls calls;
    calls.script("pthread_mutex_init", {result(11)});
    hbapi_global_data_once_init();
  }
  EXPECT_THAT(assertion_texts(), ElementsAre("pthread_mutex_init(&global_boot_ip_list_mutex, &new_mutex_attrs) == 0"));
}

TEST_F(Mutexes, FailureToMakeTheQueueMutexIsAsserted) {
  {
    SystemCalls calls;
    calls.script("pthread_mutex_init", {pass(), result(11)});
    hbapi_global_data_once_init();
  }
  EXPECT_THAT(assertion_texts(),
              ElementsAre("pthread_mutex_init(&event_queue_list_and_sequence_mutex, &new_mutex_attrs) == 0"));
}

TEST_F(Mutexes, FailureToDestroyTheAttributeIsAsserted) {
  {
    SystemCalls calls;
    calls.script("pthread_mutexattr_destroy", {result(22)});
    hbapi_global_data_once_init();
  }
  EXPECT_THAT(assertion_texts(), ElementsAre("pthread_mutexattr_destroy(&new_mutex_attrs) == 0"));
}

TEST_F(Mutexes, CleanUpHandlerUnlocksTheOneItIsGiven) {
  hbapi_global_data_once_init();
  ASSERT_EQ(pthread_mutex_lock(&global_boot_ip_list_mutex), 0);
  ASSERT_EQ(pthread_mutex_lock(&event_queue_list_and_sequence_mutex), 0);
  hbapi_mutex_cleanup_handler(&global_boot_ip_list_mutex);
  EXPECT_TRUE(is_free(global_boot_ip_list_mutex));
  EXPECT_FALSE(is_free(event_queue_list_and_sequence_mutex));
  hbapi_mutex_cleanup_handler(&event_queue_list_and_sequence_mutex);
  EXPECT_TRUE(is_free(event_queue_list_and_sequence_mutex));
}

// The event queue's mutex.

class QueueMutex : public Mutexes {
 protected:
  QueueMutex() { hbapi_global_data_once_init(); }
};

TEST_F(QueueMutex, IsHeldWhileTheQueueIsLookedAt) {
  SystemCalls calls;
  calls.only("pthread_mutex_lock", 0, &event_queue_list_and_sequence_mutex);
  calls.only("pthread_mutex_unlock", 0, &event_queue_list_and_sequence_mutex);
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_True);
  EXPECT_EQ(calls.of("pthread_mutex_lock").size(), 1U);
  EXPECT_EQ(calls.of("pthread_mutex_unlock").size(), 1U);
  EXPECT_TRUE(is_free(event_queue_list_and_sequence_mutex));
}

TEST_F(QueueMutex, FailureToLockAndToUnlockIsAsserted) {
  {
    SystemCalls calls;
    calls.only("pthread_mutex_lock", 0, &event_queue_list_and_sequence_mutex);
    calls.only("pthread_mutex_unlock", 0, &event_queue_list_and_sequence_mutex);
    calls.script("pthread_mutex_lock", {result(35)});
    calls.script("pthread_mutex_unlock", {result(1)});
    VEX_event_queue_is_empty();
  }
  EXPECT_THAT(assertion_texts(), ElementsAre("pthread_mutex_lock(&event_queue_list_and_sequence_mutex) == 0",
                                             "pthread_mutex_unlock(&event_queue_list_and_sequence_mutex) == 0"));
}

TEST_F(QueueMutex, QueueWithAnEventIsNotEmpty) {
  VEX_Event event = {};
  event_queue_list = &event;
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_False);
  event_queue_list = nullptr;
}

// Trace.

class TraceRegistration : public testing::Test {
 protected:
  TraceRegistration() {
    platform_double().reset();
    hbc_trace_inited = 0;
  }
};

TEST_F(TraceRegistration, TellsTheComponentAndItsThreeCategories) {
  hbc_initialize_trace_once();
  ASSERT_EQ(platform_double().registrations.size(), 1U);
  const Recorded_Registration& registration = platform_double().registrations[0];
  EXPECT_EQ(registration.component, "_HBC");
  ASSERT_EQ(registration.categories.size(), 3U);
  const char* const names[] = {"Errors", "Info", "Debug"};
  for (uint32_t id = 0; id < 3; ++id) {
    EXPECT_EQ(registration.categories[id].id, id);
    EXPECT_EQ(registration.categories[id].name, names[id]);
    EXPECT_EQ(registration.categories[id].default_level, id);
    EXPECT_EQ(registration.categories[id].minimum_level, 0U);
  }
  EXPECT_EQ(num_categories, 3U);
}

TEST_F(TraceRegistration, HandsOverTheLevelsAndTokensToFill) {
  platform_double().levels = {7, 8, 9};
  hbc_initialize_trace_once();
  EXPECT_EQ(sizeof hbc_trace_detail_levels, 3U);
  EXPECT_EQ(hbc_trace_detail_levels[0], 7);
  EXPECT_EQ(hbc_trace_detail_levels[1], 8);
  EXPECT_EQ(hbc_trace_detail_levels[2], 9);
  for (size_t category = 0; category < 3; ++category) {
    EXPECT_EQ(pTokens[category], Platform_Double::token(category));
  }
}

TEST_F(TraceRegistration, HappensOnce) {
  hbc_initialize_trace_once();
  EXPECT_EQ(hbc_trace_inited, 1);
  hbc_initialize_trace_once();
  EXPECT_EQ(platform_double().registrations.size(), 1U);
}

TEST_F(TraceRegistration, IsNotTriedAgainWhenItFailed) {
  platform_double().registration_result = -1;
  hbc_initialize_trace_once();
  EXPECT_EQ(hbc_trace_inited, 1);
  hbc_initialize_trace_once();
  EXPECT_EQ(platform_double().registrations.size(), 1U);
}

TEST_F(TraceRegistration, RecordsAreMadeOnlyInCategoriesThatAreOn) {
  platform_double().levels = {0, 1, 0};
  hbc_initialize_trace_once();
  trace(Trace_Errors, trace_start_failed);
  trace(Trace_Info, trace_vex_start);
  trace(Trace_Debug, trace_socket_removed);
  trace_values(Trace_Errors, trace_filter_failed, 3);
  trace_values(Trace_Info, trace_mark_alias_failed, 3, -1);
  const std::vector<Recorded_Trace>& traces = platform_double().traces;
  ASSERT_EQ(traces.size(), 2U);
  EXPECT_EQ(traces[0].form, Trace_Form::id);
  EXPECT_EQ(traces[0].component, "_HBC");
  EXPECT_EQ(traces[0].id, 272U);
  EXPECT_EQ(traces[0].category, 1);
  EXPECT_EQ(traces[1].form, Trace_Form::values);
  EXPECT_EQ(traces[1].id, 274U);
  EXPECT_EQ(traces[1].category, 1);
  EXPECT_THAT(traces[1].values, ElementsAre(3U, 0xFFFFFFFFU));
}

}  // namespace
}  // namespace hb_test
