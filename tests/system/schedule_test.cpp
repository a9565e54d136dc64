// The crontab the platform scheduler writes, read by Debian's own crontab program. It runs in a
// private mount namespace over a scratch spool, so the host's crontabs are never touched.
#include <gmock/gmock.h>
#include <unistd.h>

#include "platform/vorn_schedule.h"
#include "support/sim_root.h"

namespace {

using ::testing::HasSubstr;

const char kCrontab[] = "/var/spool/cron/crontabs/root";

// crontab installs file as nobody's table in a scratch spool, then lists what it installed.
std::string InstallAndList(const std::string& file) {
    return vorn::test::Shell(
        "unshare -m sh -c 'mount -t tmpfs none /var/spool/cron/crontabs && crontab -u nobody " +
        file + " && crontab -u nobody -l'");
}

TEST(ScheduleSystemTest, CronAcceptsAndReadsBackTheEntries) {
    if (geteuid() != 0) {
        GTEST_SKIP() << "needs root for a private mount namespace";
    }
    if (access("/usr/bin/crontab", X_OK) != 0) {
        GTEST_SKIP() << "Debian's crontab is missing (package cron)";
    }
    vorn::test::SimRoot root;
    ASSERT_EQ(VORNScheduleSet("/tmp/vornwireless.wlan0 --exec-schedule wlan0", 127, 0, 23, 0), 0);
    ASSERT_EQ(VORNScheduleSet("/usr/bin/logger \"quoted * words\"", 0x3e, 8, 17, 59), 0);
    ASSERT_EQ(VORNScheduleSet("/bin/true", 1, 23, 23, 0), 0);
    ASSERT_EQ(VORNScheduleRemove("/bin/true"), 0);
    const std::string written = root.ReadFile(kCrontab);
    EXPECT_EQ(written,
              "0 0-23 * * * /tmp/vornwireless.wlan0 --exec-schedule wlan0\n"
              "59 8-17 * * 1,2,3,4,5 /usr/bin/logger \"quoted * words\"\n");
    EXPECT_THAT(InstallAndList(root.Path(kCrontab)), HasSubstr(written));

    // The peer does check: a line out of range is refused.
    root.WriteFile("/tmp/bad", "0 24 * * * /bin/true\n");
    EXPECT_THAT(InstallAndList(root.Path("/tmp/bad")), HasSubstr("errors in crontab file"));
}

}  // namespace
