#include "utils/process.h"

#include <gtest/gtest.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>

#include "support/sim_root.h"
#include "support/waiting.h"

namespace vornwireless {
namespace utils {
namespace {

using ProcessTest = vorn::test::RootTest;

// Runs sleep under another program name (a link in the test's root).
pid_t SpawnAs(const vorn::test::SimRoot& root, const std::string& name) {
    const std::string path = root.Path("/tmp/" + name);
    EXPECT_EQ(symlink("/bin/sleep", path.c_str()), 0);
    char* const argv[] = {const_cast<char*>(path.c_str()), const_cast<char*>("100"), nullptr};
    pid_t pid = -1;
    EXPECT_EQ(posix_spawn(&pid, path.c_str(), nullptr, nullptr, argv, environ), 0);
    return pid;
}

TEST_F(ProcessTest, FindsALiveProgramByItsExactNameOnly) {
    const std::string shortName = "vp" + std::to_string(getpid()) + "tool";
    const std::string longName = "vornprocesstest-" + std::to_string(getpid()) + "-long";
    const pid_t shortOne = SpawnAs(root_, shortName);
    const pid_t longOne = SpawnAs(root_, longName);
    // Under an emulator (qemu-user) the spawn returns before the program has taken its name.
    EXPECT_TRUE(vorn::test::WaitFor([&] { return IsProcessAlive(shortName); }));
    EXPECT_TRUE(vorn::test::WaitFor([&] { return IsProcessAlive(longName); }));
    EXPECT_FALSE(IsProcessAlive(shortName.substr(0, shortName.size() - 4)));
    // The kernel keeps 15 characters of a name: they alone do not make the longer name.
    EXPECT_FALSE(IsProcessAlive(longName.substr(0, 15)));
    EXPECT_FALSE(IsProcessAlive(longName + "x"));

    // Killed but not yet reaped (a zombie) is not alive.
    kill(shortOne, SIGKILL);
    EXPECT_TRUE(vorn::test::WaitFor([&] { return !IsProcessAlive(shortName); }));
    kill(longOne, SIGKILL);
    waitpid(shortOne, nullptr, 0);
    waitpid(longOne, nullptr, 0);
    EXPECT_FALSE(IsProcessAlive(longName));
    EXPECT_FALSE(IsProcessAlive(""));
    EXPECT_FALSE(IsProcessAlive("/bin/" + shortName));
}

}  // namespace
}  // namespace utils
}  // namespace vornwireless
