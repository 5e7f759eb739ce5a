// Attaching and detaching what the daemon publishes.
#include "hb_communication/shared_memory.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/ipc.h>
#include <sys/shm.h>

#include <bit>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <string>

#include "hb_communication/connection.h"
#include "support/fake_daemon.h"
#include "support/process_state.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

class SharedMemory : public testing::Test {
 protected:
  SharedMemory() : SharedMemory(Publication()) {}

  explicit SharedMemory(const Publication& publication) : daemon(publication) {
    set_hb_errno(0);
    daemon.path().copy(SERVER_SOCK_FNAME, sizeof SERVER_SOCK_FNAME - 1);
    SERVER_SOCK_FNAME[daemon.path().size()] = '\0';
    data_for_client = nullptr;
    shared_route_info = nullptr;
    security_info = nullptr;
  }

  ~SharedMemory() override { hb_detach_shared_memory(); }

  FakeDaemon daemon;
};

TEST_F(SharedMemory, IsAttachedWithItsIdentifiers) {
  EXPECT_EQ(hb_init_shared_memory(), Hb_Success);
  EXPECT_NE(data_for_client, nullptr);
  EXPECT_NE(shared_route_info, nullptr);
  EXPECT_NE(security_info, nullptr);
  EXPECT_EQ(shm_id[0], daemon.segment_id(Segment::configuration));
  EXPECT_EQ(shm_id[1], daemon.segment_id(Segment::route));
  EXPECT_EQ(shm_id[2], daemon.segment_id(Segment::security));
  EXPECT_EQ(shm_sem_id, daemon.semaphore_id());
  EXPECT_EQ(hb_get_errno(), 0);
  EXPECT_EQ(daemon.attachments(Segment::configuration), 1);
  EXPECT_EQ(daemon.attachments(Segment::route), 1);
  EXPECT_EQ(daemon.attachments(Segment::security), 1);
}

TEST_F(SharedMemory, IsFoundByFourKeysOfTheSocketPath) {
  SystemCalls calls;
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("ftok", "ftok", "ftok", "ftok", "shmget", "shmat", "shmget", "shmat",
                                            "shmget", "shmat", "semget"));
  const intptr_t path = reinterpret_cast<intptr_t>(SERVER_SOCK_FNAME);
  EXPECT_THAT(calls.of("ftok")[0].arguments, ElementsAre(path, 103));
  EXPECT_THAT(calls.of("ftok")[1].arguments, ElementsAre(path, 104));
  EXPECT_THAT(calls.of("ftok")[2].arguments, ElementsAre(path, 112));
  EXPECT_THAT(calls.of("ftok")[3].arguments, ElementsAre(path, 105));
}

TEST_F(SharedMemory, IsAskedForInItsSizesAndNeverCreated) {
  const char* path = daemon.path().c_str();
  SystemCalls calls;
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  EXPECT_THAT(calls.of("shmget")[0].arguments, ElementsAre(ftok(path, 103), 12, 0));
  EXPECT_THAT(calls.of("shmget")[1].arguments, ElementsAre(ftok(path, 104), 552, 0));  // 3 nodes
  EXPECT_THAT(calls.of("shmget")[2].arguments, ElementsAre(ftok(path, 112), 3168, 0));
  EXPECT_THAT(calls.of("semget")[0].arguments, ElementsAre(ftok(path, 105), 2, 0));
}

TEST_F(SharedMemory, IsAttachedReadOnlyAnywhere) {
  SystemCalls calls;
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  for (size_t segment = 0; segment < 3; ++segment) {
    EXPECT_THAT(calls.of("shmat")[segment].arguments, ElementsAre(shm_id[segment], 0, SHM_RDONLY));
  }
}

TEST_F(SharedMemory, CannotBeWritten) {
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  std::ifstream maps("/proc/self/maps");
  int segments = 0;
  for (std::string line; std::getline(maps, line);) {
    if (line.find("/SYSV") != std::string::npos) {
      ++segments;
      EXPECT_NE(line.find(" r--s "), std::string::npos) << line;
    }
  }
  EXPECT_EQ(segments, 3);
}

// Layout, by the bytes that the daemon wrote.

TEST_F(SharedMemory, ShowsTheConfigurationSegment) {
  daemon.write_segment(Segment::configuration, 0, ByteBuilder().u32(9).u32(3).u32(44).bytes());
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  EXPECT_EQ(data_for_client->sequence_number, 9U);
  EXPECT_EQ(data_for_client->number_of_nodes, 3U);
  EXPECT_EQ(data_for_client->number_of_adapters, 44U);
  daemon.write_segment(Segment::configuration, 0, ByteBuilder().u32(10).bytes());
  EXPECT_EQ(*const_cast<volatile uint32_t*>(&data_for_client->sequence_number), 10U);
}

TEST_F(SharedMemory, ShowsOneRouteANode) {
  ByteBuilder route;
  route.u32(5).u16(6).u16(7);
  for (uint8_t hop = 0; hop < 11; ++hop) {
    route.zeros(15).u8(hop);
  }
  ASSERT_EQ(route.bytes().size(), 184U);
  daemon.write_segment(Segment::route, size_t{2} * 184, route.bytes());
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  const Hb_route_sequence& entry = shared_route_info[2];
  EXPECT_EQ(entry.sequence_number, 5U);
  EXPECT_EQ(entry.length, 6U);
  EXPECT_EQ(entry.nonip, 7U);
  EXPECT_EQ(entry.ip_option.sr_address[0].i6_ipv6.s6_addr[15], 0);
  EXPECT_EQ(entry.ip_option.sr_address[10].i6_ipv6.s6_addr[15], 10);
  EXPECT_EQ(shared_route_info[1].sequence_number, 0U);
}

TEST_F(SharedMemory, ShowsTheSecuritySegment) {
  const auto write = [this](size_t offset, const ByteBuilder& bytes) {
    daemon.write_segment(Segment::security, offset, bytes.bytes());
  };
  write(0, ByteBuilder().u32(77));
  write(4, ByteBuilder().u32(1).i32(11).u32(1).u32(0).u32(1).i32(3).raw("old"));
  write(284, ByteBuilder().u32(1).i32(12).u32(0).u32(1).u32(0).i32(4).raw("keys"));
  write(564, ByteBuilder().i32(5).raw("first"));
  write(564 + size_t{9} * 260, ByteBuilder().i32(4).raw("last"));
  write(564 + 2600, ByteBuilder().u32(10));
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  const Hb_security_information& security = *security_info;
  EXPECT_EQ(security.sequence_number, 77U);
  EXPECT_EQ(security.previous_sec_status.securityOn, Hb_True);
  EXPECT_EQ(security.previous_sec_status.keyCount, 11);
  EXPECT_EQ(security.previous_sec_status.TRELL_compatible, Hb_True);
  EXPECT_EQ(security.previous_sec_status.is_valid_for_signing, Hb_False);
  EXPECT_EQ(security.previous_sec_status.is_valid_for_authenticating, Hb_True);
  EXPECT_EQ(security.previous_sec_status.key.length, 3);
  EXPECT_EQ(std::memcmp(security.previous_sec_status.key.value, "old", 3), 0);
  EXPECT_EQ(security.current_sec_status.keyCount, 12);
  EXPECT_EQ(security.current_sec_status.is_valid_for_signing, Hb_True);
  EXPECT_EQ(security.current_sec_status.key.length, 4);
  EXPECT_EQ(std::memcmp(security.current_sec_status.key.value, "keys", 4), 0);
  EXPECT_EQ(security.cache.keyCache[0].length, 5);
  EXPECT_EQ(std::memcmp(security.cache.keyCache[0].value, "first", 5), 0);
  EXPECT_EQ(std::memcmp(security.cache.keyCache[9].value, "last", 4), 0);
  EXPECT_EQ(security.cache.keyCacheCount, 10U);
}

// Failures. Each step's error number follows from errno.

struct Step_Failure {
  const char* call;
  int nth;  // call of that function, from 1
  int error;
  int expected;
};

std::string step_name(const testing::TestParamInfo<Step_Failure>& info) {
  return std::string(info.param.call) + std::to_string(info.param.nth) + "_" + strerrorname_np(info.param.error);
}

class SharedMemoryFailure : public SharedMemory, public testing::WithParamInterface<Step_Failure> {};

TEST_P(SharedMemoryFailure, FollowsFromErrno) {
  SystemCalls calls;
  for (int made = 1; made < GetParam().nth; ++made) {
    calls.script(GetParam().call, {pass()});
  }
  calls.script(GetParam().call, {fail(GetParam().error)});
  EXPECT_EQ(hb_init_shared_memory(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), GetParam().expected);
  EXPECT_EQ(calls.sequence().back(), GetParam().call);  // nothing is tried behind it
}

INSTANTIATE_TEST_SUITE_P(Keys, SharedMemoryFailure,
                         testing::Values(Step_Failure{"ftok", 1, ENOENT, 28}, Step_Failure{"ftok", 2, ENOENT, 29},
                                         Step_Failure{"ftok", 3, ENOENT, 54}, Step_Failure{"ftok", 4, ENOENT, 30}),
                         step_name);

INSTANTIATE_TEST_SUITE_P(ConfigurationSegment, SharedMemoryFailure,
                         testing::Values(Step_Failure{"shmget", 1, EACCES, 31}, Step_Failure{"shmget", 1, EINVAL, 32},
                                         Step_Failure{"shmget", 1, ENOENT, 33}, Step_Failure{"shmget", 1, ENOMEM, 34},
                                         Step_Failure{"shmget", 1, ENOSPC, 35}, Step_Failure{"shmget", 1, EMFILE, 36},
                                         Step_Failure{"shmget", 1, EPERM, 36}),
                         step_name);

INSTANTIATE_TEST_SUITE_P(RouteSegment, SharedMemoryFailure,
                         testing::Values(Step_Failure{"shmget", 2, EACCES, 31}, Step_Failure{"shmget", 2, EINVAL, 32},
                                         Step_Failure{"shmget", 2, ENOENT, 33}, Step_Failure{"shmget", 2, ENOMEM, 34},
                                         Step_Failure{"shmget", 2, EMFILE, 35}, Step_Failure{"shmget", 2, ENOSPC, 36},
                                         Step_Failure{"shmget", 2, EPERM, 36}),
                         step_name);

INSTANTIATE_TEST_SUITE_P(SecuritySegment, SharedMemoryFailure,
                         testing::Values(Step_Failure{"shmget", 3, EACCES, 31}, Step_Failure{"shmget", 3, EINVAL, 32},
                                         Step_Failure{"shmget", 3, ENOENT, 33}, Step_Failure{"shmget", 3, ENOMEM, 34},
                                         Step_Failure{"shmget", 3, EMFILE, 35}, Step_Failure{"shmget", 3, ENOSPC, 36},
                                         Step_Failure{"shmget", 3, EPERM, 36}),
                         step_name);

INSTANTIATE_TEST_SUITE_P(Attaching, SharedMemoryFailure,
                         testing::Values(Step_Failure{"shmat", 1, EACCES, 37}, Step_Failure{"shmat", 1, EINVAL, 38},
                                         Step_Failure{"shmat", 1, ENOENT, 39}, Step_Failure{"shmat", 1, ENOMEM, 41},
                                         Step_Failure{"shmat", 1, EIDRM, 42}, Step_Failure{"shmat", 2, EACCES, 37},
                                         Step_Failure{"shmat", 2, EINVAL, 38}, Step_Failure{"shmat", 2, ENOENT, 39},
                                         Step_Failure{"shmat", 2, ENOMEM, 41}, Step_Failure{"shmat", 2, EIDRM, 42},
                                         Step_Failure{"shmat", 3, EACCES, 37}, Step_Failure{"shmat", 3, EINVAL, 38},
                                         Step_Failure{"shmat", 3, ENOENT, 39}, Step_Failure{"shmat", 3, ENOMEM, 41},
                                         Step_Failure{"shmat", 3, EIDRM, 42}),
                         step_name);

INSTANTIATE_TEST_SUITE_P(Semaphores, SharedMemoryFailure,
                         testing::Values(Step_Failure{"semget", 1, EACCES, 43}, Step_Failure{"semget", 1, EINVAL, 44},
                                         Step_Failure{"semget", 1, ENOENT, 45}, Step_Failure{"semget", 1, ENOMEM, 46},
                                         Step_Failure{"semget", 1, ENOSPC, 47}, Step_Failure{"semget", 1, EPERM, 48}),
                         step_name);

TEST_F(SharedMemory, WithoutAKeyFileHasNoKeys) {
  std::strcpy(SERVER_SOCK_FNAME, "/nonexistent/socket");
  EXPECT_EQ(hb_init_shared_memory(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 28);
}

TEST_F(SharedMemory, ThatCannotBeAttachedIsNull) {
  auto* const other = reinterpret_cast<char*>(this);
  for (int step = 0; step < 3; ++step) {
    data_for_client = reinterpret_cast<Hb_memory_configuration_data*>(other);
    shared_route_info = reinterpret_cast<Hb_route_sequence*>(other);
    security_info = reinterpret_cast<Hb_security_information*>(other);
    {
      SystemCalls calls;
      for (int made = 0; made < step; ++made) {
        calls.script("shmat", {pass()});
      }
      calls.script("shmat", {fail(EINVAL)});
      EXPECT_EQ(hb_init_shared_memory(), Hb_Failure);
    }
    const void* const attached[] = {data_for_client, shared_route_info, security_info};
    EXPECT_EQ(attached[step], nullptr) << step;
    for (int later = step + 1; later < 3; ++later) {
      EXPECT_EQ(attached[later], other) << later;  // not reached
    }
    security_info = nullptr;
    shared_route_info = step > 1 ? shared_route_info : nullptr;
    data_for_client = step > 0 ? data_for_client : nullptr;
    hb_detach_shared_memory();
  }
}

TEST_F(SharedMemory, AttachedBeforeAFailureStaysUntilTheNextDetach) {
  const int segments = attached_segments();
  {
    SystemCalls calls;
    calls.script("semget", {fail(ENOENT)});
    EXPECT_EQ(hb_init_shared_memory(), Hb_Failure);
  }
  EXPECT_EQ(attached_segments(), segments + 3);
  hb_detach_shared_memory();
  EXPECT_EQ(attached_segments(), segments);
}

TEST_F(SharedMemory, AttachedBeforeAFailureOfTheSecondSegmentIsTheFirst) {
  daemon.remove_segment(Segment::route);
  const int segments = attached_segments();
  EXPECT_EQ(hb_init_shared_memory(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 33);
  EXPECT_NE(data_for_client, nullptr);
  EXPECT_EQ(attached_segments(), segments + 1);
}

// A cluster without nodes.

TEST_F(SharedMemory, OfNoNodesIsAskedForWithSizeZero) {
  daemon.write_segment(Segment::configuration, 4, ByteBuilder().u32(0).bytes());
  SystemCalls calls;
  calls.script("shmget", {pass(), fail(EINVAL)});
  EXPECT_EQ(hb_init_shared_memory(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 32);
  EXPECT_EQ(calls.of("shmget")[1].arguments[1], 0);
}

TEST_F(SharedMemory, OfNoNodesIsRefusedAlsoWhereTheSystemDoesNot) {
  daemon.write_segment(Segment::configuration, 4, ByteBuilder().u32(0).bytes());
  EXPECT_EQ(hb_init_shared_memory(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 32);
  EXPECT_EQ(shared_route_info, nullptr);
}

TEST_F(SharedMemory, OfMoreNodesThanAnySegmentHoldsFails) {
  daemon.write_segment(Segment::configuration, 4, ByteBuilder().u32(0xFFFFFFFFU).bytes());
  SystemCalls calls;
  EXPECT_EQ(hb_init_shared_memory(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 32);
  EXPECT_EQ(calls.of("shmget")[1].arguments[1], intptr_t{0xFFFFFFFF} * 184);
}

// Detaching.

TEST_F(SharedMemory, IsDetachedInTheOrderOfItsSegments) {
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  const intptr_t attached[] = {reinterpret_cast<intptr_t>(data_for_client),
                               reinterpret_cast<intptr_t>(shared_route_info),
                               reinterpret_cast<intptr_t>(security_info)};
  SystemCalls calls;
  hb_detach_shared_memory();
  ASSERT_EQ(calls.of("shmdt").size(), 3U);
  for (size_t segment = 0; segment < 3; ++segment) {
    EXPECT_EQ(calls.of("shmdt")[segment].arguments[0], attached[segment]);
  }
  EXPECT_EQ(data_for_client, nullptr);
  EXPECT_EQ(shared_route_info, nullptr);
  EXPECT_EQ(security_info, nullptr);
}

TEST_F(SharedMemory, LeavesNothingAttachedAndTheDaemonsObjectsAlone) {
  const int segments = attached_segments();
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  const int ids[] = {shm_id[0], shm_id[1], shm_id[2], shm_sem_id};
  hb_detach_shared_memory();
  EXPECT_EQ(attached_segments(), segments);
  EXPECT_EQ(daemon.attachments(Segment::configuration), 0);
  EXPECT_THAT(ids, ElementsAre(shm_id[0], shm_id[1], shm_id[2], shm_sem_id));
  EXPECT_EQ(hb_init_shared_memory(), Hb_Success);  // all of it is still there
}

TEST_F(SharedMemory, DetachedTwiceIsDetachedOnce) {
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  hb_detach_shared_memory();
  SystemCalls calls;
  hb_detach_shared_memory();
  EXPECT_TRUE(calls.sequence().empty());
}

TEST_F(SharedMemory, DetachesNeitherNullNorAllOnes) {
  ASSERT_EQ(hb_init_shared_memory(), Hb_Success);
  ASSERT_EQ(shmdt(shared_route_info), 0);
  ASSERT_EQ(shmdt(data_for_client), 0);
  shared_route_info = std::bit_cast<Hb_route_sequence*>(intptr_t{-1});
  data_for_client = nullptr;
  SystemCalls calls;
  hb_detach_shared_memory();
  EXPECT_EQ(calls.of("shmdt").size(), 1U);
  EXPECT_EQ(shared_route_info, nullptr);
  EXPECT_EQ(security_info, nullptr);
}

}  // namespace
}  // namespace hb_test
