#include <gmock/gmock.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "support/sim_root.h"

namespace vorn {
namespace platform {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::StartsWith;

using SimulatorTest = test::RootTest;

std::string FirstLine(const std::string& commandLine) {
    std::string line;
    EXPECT_EQ(ReadShellCommandLine(commandLine, line), 0) << commandLine;
    return line;
}

TEST_F(SimulatorTest, RecordsCallsAndAnswersFromTheScenario) {
    root_.Scenario("ip",
                   "# first match wins\n"
                   "when route show table main\n"
                   "print default via 10.0.0.1 dev eth0\n"
                   "when route show *\n"
                   "print other table\n"
                   "exit 3\n"
                   "when -6 *\n"
                   "stderr RTNETLINK answers: No such device\n"
                   "exit 2\n");

    EXPECT_EQ(FirstLine("/sbin/ip route show table main"), "default via 10.0.0.1 dev eth0\n");
    EXPECT_EQ(FirstLine("/sbin/ip route show table 7 >/dev/null; echo $?"), "3\n");
    EXPECT_EQ(FirstLine("/sbin/ip -6 addr 2>&1 >/dev/null; echo $?"),
              "RTNETLINK answers: No such device\n");
    EXPECT_EQ(FirstLine("/sbin/ip link show; echo $?"), "0\n");
    EXPECT_EQ(FirstLine("/usr/vorn/sbin/brctl show; echo $?"), "0\n");

    EXPECT_THAT(root_.Calls(),
                ElementsAre("/sbin/ip route show table main", "/sbin/ip route show table 7",
                            "/sbin/ip -6 addr", "/sbin/ip link show", "/usr/vorn/sbin/brctl show"));
    root_.ClearCalls();
    EXPECT_TRUE(root_.Calls().empty());
}

TEST_F(SimulatorTest, RecordsOddArgumentsUnambiguously) {
    FirstLine("/etc/rc.network start-nat 'it'\\''s a' '' x=y");
    FirstLine("/sbin/iwconfig 'two\nlines'");

    const auto calls = root_.Calls();
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[0], "/etc/rc.network start-nat 'it'\\''s a' '' x=y");
    EXPECT_EQ(calls[1], "/sbin/iwconfig 'two'$'\\n''lines'");
    // The shell reads the recorded words back as they were given.
    EXPECT_EQ(FirstLine("printf '%s|' " + calls[0].substr(calls[0].find(' ') + 1) + "; echo"),
              "start-nat|it's a||x=y|\n");
}

TEST_F(SimulatorTest, CopiedRootRunsOnItsOwn) {
    namespace fs = std::filesystem;
    const std::string copy = root_.Dir() + "-copy";
    fs::copy(root_.Dir(), copy, fs::copy_options::recursive | fs::copy_options::copy_symlinks);
    // With the original simulator gone, only links relative to the copy still lead anywhere.
    fs::remove(root_.Path("/.vornsim/vornsim"));
    setenv("VORN_ROOT", copy.c_str(), 1);

    EXPECT_EQ(FirstLine("/usr/bin/hostapd_cli -i wlan0 status; echo $?"), "0\n");

    std::ifstream log(copy + "/.vornsim/calls");
    std::string call;
    EXPECT_TRUE(std::getline(log, call));
    EXPECT_EQ(call, "/usr/bin/hostapd_cli -i wlan0 status");
    EXPECT_TRUE(root_.Calls().empty());
    fs::remove_all(copy);
}

TEST_F(SimulatorTest, HostToolsAndBusyboxPsWorkInTheRoot) {
    EXPECT_EQ(FirstLine("/bin/grep '^net_topology=' " + ShellRootPath("/etc/vorninfo.conf") +
                        " | /usr/bin/cut -d'\"' -f2"),
              "router\n");
    EXPECT_EQ(FirstLine("/bin/ls -A " + ShellRootPath("/usr/vorn/etc/wifi") + " | /usr/bin/wc -l"),
              "0\n");

    std::ifstream cmdline("/proc/self/cmdline");
    std::string self;
    ASSERT_TRUE(std::getline(cmdline, self, '\0'));
    const std::string pid = std::to_string(getpid());
    const std::string line = FirstLine("/bin/ps -I | /bin/grep '" + self +
                                       "' | /bin/grep -v grep | " + "/bin/grep '^ *" + pid + " '");
    EXPECT_THAT(line, HasSubstr(self));
}

TEST(LiveSimRootTest, PassesNetworkToolsToTheHost) {
    test::SimRoot root(test::SimRoot::Kind::kLive);
    std::string line;
    ASSERT_EQ(ReadShellCommandLine("/sbin/ip -V", line), 0);
    EXPECT_THAT(line, StartsWith("ip utility"));
    EXPECT_THAT(root.Calls(), ElementsAre("/sbin/ip -V"));
    EXPECT_TRUE(root.Exists("/proc/self/status"));
}

}  // namespace
}  // namespace platform
}  // namespace vorn
