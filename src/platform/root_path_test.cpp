#include "platform/root_path.h"

#include <gtest/gtest.h>

#include <cstdlib>

namespace vorn::platform {
namespace {

TEST(RootPathTest, PathsAndProgramsMoveUnderTheRoot) {
    setenv("VORN_ROOT", "/tmp/r oot/", 1);
    EXPECT_EQ(Root(), "/tmp/r oot");
    EXPECT_EQ(RootPath("/etc/vorninfo.conf"), "/tmp/r oot/etc/vorninfo.conf");
    EXPECT_EQ(RootPath("relative/file"), "relative/file");
    EXPECT_EQ(ShellRootPath("/usr/vorn/etc/wifi/wifi_ap_*"),
              "'/tmp/r oot'/usr/vorn/etc/wifi/wifi_ap_*");
    EXPECT_EQ(
        RootShellCommand("/bin/ps -I | /bin/grep 'a|/x' | /bin/grep -v grep"),
        "'/tmp/r oot'/bin/ps -I | '/tmp/r oot'/bin/grep 'a|/x' | '/tmp/r oot'/bin/grep -v grep");
    // Arguments and redirections stay; programs after ;, && and ( move.
    EXPECT_EQ(RootShellCommand("/bin/ls /a 2>/dev/null&&(/usr/bin/wc -l);echo \"/x;/y\""),
              "'/tmp/r oot'/bin/ls /a 2>/dev/null&&('/tmp/r oot'/usr/bin/wc -l);echo \"/x;/y\"");
    setenv("VORN_ROOT", "/", 1);
    EXPECT_EQ(RootPath("/etc/x"), "/etc/x");
    unsetenv("VORN_ROOT");
    EXPECT_EQ(RootPath("/etc/x"), "/etc/x");
    EXPECT_EQ(RootShellCommand("/bin/ls /a"), "/bin/ls /a");

    EXPECT_EQ(ShellQuote("eth0"), "eth0");
    EXPECT_EQ(ShellQuote(""), "''");
    EXPECT_EQ(ShellQuote("it's a"), "'it'\\''s a'");
}

}  // namespace
}  // namespace vorn::platform
