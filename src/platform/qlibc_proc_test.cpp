#include "platform/qlibc_proc.h"

#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "support/sim_root.h"

namespace {

using Calls = std::vector<std::string>;

class QlibcProcTest : public vorn::test::RootTest {};

TEST_F(QlibcProcTest, ProgramsRunUnderTheRootWithTheirArgumentWords) {
    root_.Scenario("ip",
                   "when route add default via 10.0.0.9 *\n"
                   "stderr Error: Nexthop has invalid gateway.\n"
                   "exit 2\n");
    EXPECT_EQ(QLIBCExecl("/sbin/ip", 187, "route", "add", "default", "via", "10.0.0.1", "dev",
                         "eth0", static_cast<char*>(nullptr)),
              0);
    EXPECT_EQ(QLIBCExecl("/sbin/ip", 187, "route", "add", "default", "via", "10.0.0.9", "dev",
                         "eth0", static_cast<char*>(nullptr)),
              -1);
    EXPECT_EQ(QLIBCExec("/usr/vorn/sbin/brctl", "addif", "br0", "it's here", nullptr), 0);
    // A bare name is found on PATH, which the fixture starts with the root's folders.
    EXPECT_EQ(QLIBCExecl("iwconfig", QLIBC_EXEC_WAIT, "wlan0", static_cast<char*>(nullptr)), 0);
    EXPECT_EQ(QLIBCExecl("/sbin/none", QLIBC_EXEC_WAIT, static_cast<char*>(nullptr)), -1);
    EXPECT_EQ(root_.Calls(),
              (Calls{"/sbin/ip route add default via 10.0.0.1 dev eth0",
                     "/sbin/ip route add default via 10.0.0.9 dev eth0",
                     "/usr/vorn/sbin/brctl addif br0 'it'\\''s here'", "/sbin/iwconfig wlan0"}));
}

TEST_F(QlibcProcTest, ShellLinesAndBackgroundRuns) {
    root_.Scenario("rc.network", "when stop-ap *\nexit 1\n");
    EXPECT_EQ(QLIBCSystem("/etc/rc.network start-ap wlan0 | /bin/cat > /dev/null"), 0);
    EXPECT_EQ(QLIBCSystem("/etc/rc.network stop-ap wlan0"), -1);

    root_.ClearCalls();
    ASSERT_EQ(QLIBCExecl("/sbin/ifconfig", QLIBC_EXEC_NO_STDIN, "wlan0", "up",
                         static_cast<char*>(nullptr)),
              0);
    for (int i = 0; i < 200 && root_.Calls().empty(); ++i) {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    EXPECT_EQ(root_.Calls(), (Calls{"/sbin/ifconfig wlan0 up"}));
}

TEST_F(QlibcProcTest, PidFiles) {
    ASSERT_EQ(QLIBCProcPidFileCreate("/var/run/test.pid"), 0);
    EXPECT_EQ(root_.ReadFile("/var/run/test.pid"), std::to_string(getpid()) + "\n");
    EXPECT_EQ(QLIBCReadPidFile("/var/run/test.pid"), getpid());
    EXPECT_EQ(QLIBCProcAlive(getpid()), 1);
    EXPECT_EQ(QLIBCProcAlive(0), 0);
    EXPECT_EQ(QLIBCReadPidFile("/var/run/none.pid"), -1);
    root_.WriteFile("/var/run/junk.pid", "not a pid\n");
    EXPECT_EQ(QLIBCReadPidFile("/var/run/junk.pid"), 0);

    const pid_t child = fork();
    if (child == 0) {
        pause();
        _exit(0);
    }
    root_.WriteFile("/var/run/child.pid", std::to_string(child) + "\n");
    ASSERT_EQ(QLIBCProcSignalByPidFile("/var/run/child.pid", SIGTERM), 0);
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFSIGNALED(status));
    EXPECT_EQ(QLIBCProcAlive(child), 0);
    EXPECT_EQ(QLIBCProcSignalByPidFile("/var/run/none.pid", SIGTERM), -1);
}

}  // namespace
