#include "utils/semaphore.h"

#include <gtest/gtest.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/wait.h>
#include <unistd.h>

#include <random>

namespace vornwireless::semaphore {
namespace {

TEST(SemaphoreTest, GetKeepsTheValueOfAnExistingSetAndADeadHolderReleasesIt) {
    // Never IPC_PRIVATE (0), and unlikely to meet a set of anyone else.
    const uint32_t key = std::random_device()() | 0x40000000u;
    const auto value = [key] { return semctl(semget(static_cast<key_t>(key), 1, 0), 0, GETVAL); };
    const Semaphore semaphore(key);
    EXPECT_EQ(semaphore.Get(nullptr), -1);
    int id = -1;
    ASSERT_EQ(semaphore.Get(&id), 0);
    EXPECT_EQ(value(), 1);
    ASSERT_EQ(semaphore.Enter(), 0);
    int again = -1;
    ASSERT_EQ(Semaphore(key).Get(&again), 0);
    EXPECT_EQ(again, id);
    EXPECT_EQ(value(), 0);
    EXPECT_EQ(semaphore.Release(), 0);
    EXPECT_EQ(value(), 1);

    const pid_t child = fork();
    if (child == 0) {
        _exit(semaphore.Enter() == 0 ? 0 : 1);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    EXPECT_EQ(value(), 1);
    semctl(id, 0, IPC_RMID);
}

}  // namespace
}  // namespace vornwireless::semaphore
