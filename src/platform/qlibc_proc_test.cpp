#include "platform/qlibc_proc.h"

#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include "support/sim_root.h"
#include "support/waiting.h"

namespace {

using Calls = std::vector<std::string>;
using QlibcProcTest = vorn::test::RootTest;

TEST_F(QlibcProcTest, ProgramsRunUnderTheRootWithTheirArgumentWords) {
    root_.Scenario("ip", "when route add default via 10.0.0.9 *\nstderr Error: Nexthop\nexit 2\n");
    root_.Scenario("rc.network", "when stop-ap *\nexit 1\n");
    const auto route = [](const char* via) {
        return QLIBCExecl("/sbin/ip", 187, "route", "add", "default", "via", via, "dev", "eth0",
                          static_cast<char*>(nullptr));
    };
    EXPECT_EQ(route("10.0.0.1"), 0);
    EXPECT_EQ(route("10.0.0.9"), -1);
    EXPECT_EQ(QLIBCExec("/usr/vorn/sbin/brctl", "addif", "br0", "it's here", nullptr), 0);
    // A bare name is found on PATH, which the fixture starts with the root's folders.
    EXPECT_EQ(QLIBCExecl("iwconfig", QLIBC_EXEC_WAIT, "wlan0", static_cast<char*>(nullptr)), 0);
    EXPECT_EQ(QLIBCExecl("/sbin/none", QLIBC_EXEC_WAIT, static_cast<char*>(nullptr)), -1);
    EXPECT_EQ(QLIBCSystem("/etc/rc.network start-ap wlan0 | /bin/cat > /dev/null"), 0);
    EXPECT_EQ(QLIBCSystem("/etc/rc.network stop-ap wlan0"), -1);
    EXPECT_EQ(root_.Calls(),
              (Calls{"/sbin/ip route add default via 10.0.0.1 dev eth0",
                     "/sbin/ip route add default via 10.0.0.9 dev eth0",
                     "/usr/vorn/sbin/brctl addif br0 'it'\\''s here'", "/sbin/iwconfig wlan0",
                     "/etc/rc.network start-ap wlan0", "/etc/rc.network stop-ap wlan0"}));
    root_.ClearCalls();
    ASSERT_EQ(QLIBCExecl("/sbin/ifconfig", QLIBC_EXEC_NO_STDIN, "wlan0", "up",
                         static_cast<char*>(nullptr)),
              0);  // in the background
    EXPECT_TRUE(vorn::test::WaitFor([this] { return !root_.Calls().empty(); }));
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
