#include "utils/create_pid_file.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include "support/sim_root.h"

namespace vornwireless::utils {
namespace {

using CreatePidFileTest = vorn::test::RootTest;

TEST_F(CreatePidFileTest, HoldsTheLockAgainstOtherProcesses) {
    const std::string path = "/var/run/h2test.pid";
    root_.WriteFile(path, "a much longer stale content\n");
    const int fd = CreatePidFile(path);
    ASSERT_GE(fd, 0);
    EXPECT_NE(fcntl(fd, F_GETFD) & FD_CLOEXEC, 0);

    // Record locks are not inherited, so a forked child competes like a second instance. (The
    // file is read only afterwards: closing any descriptor of it drops this process's lock.)
    const pid_t child = fork();
    if (child == 0) {
        log_.Clear();
        _exit(CreatePidFile(path) == -1 && log_.Lines().empty() ? 0 : 1);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    EXPECT_EQ(root_.ReadFile(path), std::to_string(getpid()) + "\n");
    close(fd);

    EXPECT_EQ(CreatePidFile("/no/such/dir/x.pid"), -1);
    EXPECT_TRUE(log_.Contains("create_pid_file.cpp:"));
    EXPECT_TRUE(log_.Contains(" Could not open PID file [/no/such/dir/x.pid]"));
}

}  // namespace
}  // namespace vornwireless::utils
