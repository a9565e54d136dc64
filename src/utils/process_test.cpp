#include "utils/process.h"

#include <gtest/gtest.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "support/sim_root.h"

namespace vornwireless {
namespace utils {
namespace {

using ProcessTest = vorn::test::RootTest;

TEST_F(ProcessTest, FindsARunningProcessByName) {
    // A process whose command line no other test run shares.
    const std::string seconds = "1000." + std::to_string(getpid());
    char* const argv[] = {const_cast<char*>("sleep"), const_cast<char*>(seconds.c_str()), nullptr};
    pid_t sleeper = -1;
    ASSERT_EQ(posix_spawnp(&sleeper, "sleep", nullptr, nullptr, argv, environ), 0);
    const bool found = IsProcessAlive("sleep " + seconds);
    kill(sleeper, SIGTERM);
    waitpid(sleeper, nullptr, 0);
    EXPECT_TRUE(found);
    EXPECT_FALSE(IsProcessAlive("sleep " + seconds));
}

TEST_F(ProcessTest, RefusesNamesThatCannotBeSingleQuoted) {
    const std::vector<std::string> names = {"", "a'b", "a\\b", "a\nb", std::string(1100, 'x')};
    for (const auto& name : names) {
        EXPECT_FALSE(IsProcessAlive(name));
    }
    EXPECT_EQ(log_.Matching(" Refused process name").size(), 5u);
}

}  // namespace
}  // namespace utils
}  // namespace vornwireless
