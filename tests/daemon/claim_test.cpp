/* Keys that somebody else uses. The keys are scripted: real ones depend on inodes. */
#include "claim.h"

#include <gmock/gmock.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <filesystem>
#include <random>
#include <vector>

#include "support/temporary_directory.h"

namespace {

key_t first_key = 0;               /* keys are this and the following ones, by project */
bool all_files_share_keys = false; /* as if there were no other inode */
std::vector<ino_t> files;          /* each file has its own keys, in the order in which they are seen */

}  // namespace

extern "C" key_t __wrap_ftok(const char* path, int project) {
  struct stat file {};
  if (stat(path, &file) != 0) {
    return -1;
  }
  if (std::find(files.begin(), files.end(), file.st_ino) == files.end()) {
    files.push_back(file.st_ino);
  }
  const auto place = std::find(files.begin(), files.end(), file.st_ino) - files.begin();
  return first_key + (all_files_share_keys ? 0 : static_cast<key_t>(place) * 256) + project;
}

namespace {

const hbd::Publication published{{1, 4, 8}, {}};
constexpr std::chrono::milliseconds patience{1000};

class Keys : public testing::Test {
 protected:
  Keys() {
    std::random_device random;
    first_key = static_cast<key_t>(0x10000000U + (random() & 0x0FFFF000U));
  }
  ~Keys() override {
    for (const int id : foreign_) {
      shmctl(id, IPC_RMID, nullptr);
    }
  }

  /* A segment of this process at the key of a project. */
  void occupy(int project, std::size_t size) {
    foreign_.push_back(shmget(first_key + project, size, IPC_CREAT | 0600));
  }

  /* The same, of a process that has ended. */
  int leave_behind(int project, std::size_t size) {
    const pid_t child = fork();
    if (child == 0) {
      _exit(shmget(first_key + project, size, IPC_CREAT | 0600) == -1 ? 1 : 0);
    }
    waitpid(child, nullptr, 0);
    return shmget(first_key + project, 0, 0);
  }

  static bool is_there(int id) {
    shmid_ds state{};
    return shmctl(id, IPC_STAT, &state) == 0;
  }

  hbd::Loop loop_;
  TemporaryDirectory directory_;
  std::string path_ = directory_.path("socket");
  std::vector<int> foreign_;
};

TEST_F(Keys, that_are_taken_leave_no_object_of_an_attempt_behind) {
  path_ = directory_.write("file", "");
  occupy(HB_SECURITY_SEGMENT_ID, 3168);
  EXPECT_THROW(hbd::Publisher(loop_, path_, published, patience), hbd::KeyTaken);
  EXPECT_EQ(semget(first_key + HB_SEMAPHORE_SET_ID, 0, 0), -1);
  EXPECT_EQ(shmget(first_key + HB_CONFIGURATION_SEGMENT_ID, 0, 0), -1);
  EXPECT_EQ(shmget(first_key + HB_ROUTE_SEGMENT_ID, 0, 0), -1);
  EXPECT_TRUE(is_there(foreign_[0]));
}

TEST_F(Keys, that_are_taken_by_a_live_process_make_the_socket_file_be_made_anew) {
  occupy(HB_ROUTE_SEGMENT_ID, std::size_t{4} * 184);
  const hbd::Claim claim(loop_, path_, published, patience);
  EXPECT_TRUE(is_there(foreign_[0]));
  EXPECT_NE(shmget(first_key + 256 + HB_ROUTE_SEGMENT_ID, 0, 0), -1);
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(directory_.path("")), {}), 1);
}

TEST_F(Keys, that_stay_taken_end_in_a_failure_that_leaves_no_file) {
  all_files_share_keys = true;
  occupy(HB_ROUTE_SEGMENT_ID, std::size_t{4} * 184);
  EXPECT_THROW(hbd::Claim(loop_, path_, published, patience), hbd::Failure);
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(directory_.path("")), {}), 0);
}

TEST_F(Keys, of_objects_whose_maker_is_gone_are_taken_over) {
  const int left = leave_behind(HB_CONFIGURATION_SEGMENT_ID, 12);
  const hbd::Claim claim(loop_, path_, published, patience);
  EXPECT_FALSE(is_there(left));
  EXPECT_NE(shmget(first_key + HB_CONFIGURATION_SEGMENT_ID, 12, 0), -1);
}

TEST_F(Keys, of_objects_of_another_shape_are_left_alone_although_the_maker_is_gone) {
  all_files_share_keys = true;
  foreign_.push_back(leave_behind(HB_CONFIGURATION_SEGMENT_ID, 13));
  EXPECT_THROW(hbd::Claim(loop_, path_, published, patience), hbd::Failure);
  EXPECT_TRUE(is_there(foreign_[0]));
}

TEST_F(Keys, of_a_semaphore_set_without_segments_are_taken_over_when_all_who_touched_it_are_gone) {
  const pid_t child = fork();
  if (child == 0) {
    const int id = semget(first_key + HB_SEMAPHORE_SET_ID, 2, IPC_CREAT | 0600);
    std::array<sembuf, 2> both = {{{0, 1, 0}, {1, 1, 0}}};
    _exit(semop(id, both.data(), both.size()) == 0 ? 0 : 1);
  }
  waitpid(child, nullptr, 0);
  const int left = semget(first_key + HB_SEMAPHORE_SET_ID, 0, 0);
  ASSERT_NE(left, -1);
  const hbd::Claim claim(loop_, path_, published, patience);
  EXPECT_EQ(semctl(left, 0, GETVAL), -1);
}

TEST_F(Keys, of_the_semaphores_of_a_live_process_are_left_alone) {
  all_files_share_keys = true;
  const int id = semget(first_key + HB_SEMAPHORE_SET_ID, 2, IPC_CREAT | 0600);
  std::array<sembuf, 2> both = {{{0, 1, 0}, {1, 1, 0}}};
  ASSERT_EQ(semop(id, both.data(), both.size()), 0);
  EXPECT_THROW(hbd::Claim(loop_, path_, published, patience), hbd::Failure);
  EXPECT_EQ(semctl(id, 0, GETVAL), 1);
  semctl(id, 0, IPC_RMID);
}

}  // namespace
