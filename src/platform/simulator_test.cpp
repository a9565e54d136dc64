#include <gmock/gmock.h>

#include "platform/shell_command.h"
#include "support/sim_root.h"

namespace vorn::platform {
namespace {

using ::testing::ElementsAre;

using SimulatorTest = test::RootTest;

std::string FirstLine(const std::string& commandLine) {
    std::string line;
    EXPECT_EQ(ReadShellCommandLine(commandLine, line), 0) << commandLine;
    return line;
}

TEST_F(SimulatorTest, AnswersFromTheScenarioAndRecordsArgumentWordsUnambiguously) {
    root_.Scenario("ip",
                   "# first match wins\nwhen route show table main\nprint default via 10.0.0.1\n"
                   "when route show *\nprint other\nexit 3\n"
                   "when -6 *\nstderr RTNETLINK answers: No such device\nexit 2\n");
    EXPECT_EQ(FirstLine("/sbin/ip route show table main"), "default via 10.0.0.1\n");
    EXPECT_EQ(FirstLine("/sbin/ip route show table 7 >/dev/null; echo $?"), "3\n");
    EXPECT_EQ(FirstLine("/sbin/ip -6 addr 2>&1 >/dev/null"), "RTNETLINK answers: No such device\n");
    EXPECT_EQ(FirstLine("/usr/vorn/sbin/brctl show; echo $?"), "0\n");
    // Programs the wifi half runs are there too.
    EXPECT_EQ(FirstLine("/usr/sbin/dhclient -x wlan0; /usr/vorn/sbin/vornnetdtool "
                        "--refresh-gateway all; echo $?"),
              "0\n");
    FirstLine("/etc/rc.network start-nat 'it'\\''s a' '' x=y");
    FirstLine("/sbin/iwconfig 'two\nlines'");
    const auto calls = root_.Calls();
    EXPECT_THAT(calls, ElementsAre("/sbin/ip route show table main", "/sbin/ip route show table 7",
                                   "/sbin/ip -6 addr", "/usr/vorn/sbin/brctl show",
                                   "/usr/sbin/dhclient -x wlan0",
                                   "/usr/vorn/sbin/vornnetdtool --refresh-gateway all",
                                   "/etc/rc.network start-nat 'it'\\''s a' '' x=y",
                                   "/sbin/iwconfig 'two'$'\\n''lines'"));
    // The shell reads the recorded words back as they were given.
    EXPECT_EQ(FirstLine("printf '%s|' " + calls[6].substr(calls[6].find(' ') + 1) + "; echo"),
              "start-nat|it's a||x=y|\n");
}

}  // namespace
}  // namespace vorn::platform
