#include "utils/semaphore.h"

#include <gtest/gtest.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/wait.h>
#include <unistd.h>

#include <random>

namespace vornwireless {
namespace semaphore {
namespace {

class SemaphoreTest : public ::testing::Test {
  protected:
    void TearDown() override {
        const int id = semget(static_cast<key_t>(key_), 1, 0);
        if (id >= 0) {
            semctl(id, 0, IPC_RMID);
        }
    }

    int Value() const { return semctl(semget(static_cast<key_t>(key_), 1, 0), 0, GETVAL); }

    // Never IPC_PRIVATE (0), and unlikely to meet a set of anyone else.
    const uint32_t key_ = std::random_device()() | 0x40000000u;
};

TEST_F(SemaphoreTest, GetKeepsTheValueOfAnExistingSet) {
    const Semaphore semaphore(key_);
    EXPECT_EQ(semaphore.Get(nullptr), -1);
    int id = -1;
    ASSERT_EQ(semaphore.Get(&id), 0);
    EXPECT_EQ(Value(), 1);

    ASSERT_EQ(semaphore.Enter(), 0);
    int again = -1;
    ASSERT_EQ(Semaphore(key_).Get(&again), 0);
    EXPECT_EQ(again, id);
    EXPECT_EQ(Value(), 0);
    EXPECT_EQ(semaphore.Release(), 0);
    EXPECT_EQ(Value(), 1);
}

TEST_F(SemaphoreTest, AHolderThatDiesReleasesIt) {
    const Semaphore semaphore(key_);
    const pid_t child = fork();
    if (child == 0) {
        _exit(semaphore.Enter() == 0 ? 0 : 1);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    EXPECT_EQ(Value(), 1);
}

}  // namespace
}  // namespace semaphore
}  // namespace vornwireless
