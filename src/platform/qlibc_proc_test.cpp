#include "platform/qlibc_proc.h"

#include <gmock/gmock.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <fstream>

#include "platform/shell_command.h"

#include "support/sim_root.h"
#include "support/waiting.h"

namespace {

using Calls = std::vector<std::string>;
using QlibcProcTest = vorn::test::RootTest;
using ::testing::Contains;
using ::testing::HasSubstr;

extern "C" char** environ;

pid_t Spawn(const std::string& program, const char* arg) {
    char* const argv[] = {const_cast<char*>(program.c_str()), const_cast<char*>(arg), nullptr};
    pid_t pid = -1;
    EXPECT_EQ(posix_spawn(&pid, program.c_str(), nullptr, nullptr, argv, environ), 0);
    return pid;
}

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

TEST_F(QlibcProcTest, AProgramPastTheDeadlineIsKilledWithAllItStarted) {
    QLIBCExecSetTimeout(300);
    const std::string pidFile = root_.Path("/tmp/grandchild.pid");
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(QLIBCExecl("/bin/sh", QLIBC_EXEC_WAIT, "-c",
                         ("sleep 30 & echo $! > " + pidFile + "; wait").c_str(),
                         static_cast<char*>(nullptr)),
              -1);
    EXPECT_EQ(QLIBCSystem("/bin/sleep 30"), -1);
    std::vector<std::string> lines;
    EXPECT_EQ(vorn::platform::ReadShellCommandLines("echo early; /bin/sleep 30", lines), -1);
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(20));
    std::string grandchild;
    std::ifstream(pidFile) >> grandchild;
    ASSERT_FALSE(grandchild.empty());
    EXPECT_TRUE(vorn::test::WaitFor([&] { return vorn::test::HasEnded(std::stol(grandchild)); }));
    EXPECT_THAT(log_.Lines(), Contains(HasSubstr("Killed [/bin/sh -c sleep 30 &")));
    EXPECT_THAT(log_.Lines(), Contains(HasSubstr("Killed [echo early; /bin/sleep 30]")));
    QLIBCExecSetTimeout(0);
    EXPECT_EQ(QLIBCSystem("/bin/sleep 0.5"), 0);
}

TEST_F(QlibcProcTest, KillByNameMatchesTheWholeProgramName) {
    // Longer than the 15 characters the kernel keeps, and unique to this run.
    const std::string name = "vorn-kill-test-" + std::to_string(getpid());
    const std::string program = root_.Dir() + "/" + name;
    ASSERT_EQ(symlink("/bin/sleep", program.c_str()), 0);
    const pid_t first = Spawn(program, "30");
    const pid_t second = Spawn(program, "30");
    EXPECT_EQ(QLIBCProcKillByName(name.substr(0, 15).c_str(), SIGTERM), 0);
    EXPECT_EQ(QLIBCProcKillByName((name + "x").c_str(), SIGTERM), 0);
    EXPECT_EQ(QLIBCProcKillByName(name.c_str(), SIGTERM), 2);
    for (const pid_t pid : {first, second}) {
        int status = 0;
        ASSERT_EQ(waitpid(pid, &status, 0), pid);
        EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGTERM);
    }
    EXPECT_EQ(QLIBCProcKillByName(name.c_str(), SIGTERM), 0);
    EXPECT_EQ(QLIBCProcKillByName("", SIGTERM), -1);
}

}  // namespace
