#include "platform/vorn_schedule.h"

#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include "support/sim_root.h"

namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using VornScheduleTest = vorn::test::RootTest;

const char kCrontab[] = "/var/spool/cron/crontabs/root";
const char kWifi[] = "/tmp/vornwireless.wlan0 --exec-schedule wlan0";

TEST_F(VornScheduleTest, OneLinePerCommandOtherLinesKeptLinksReplacedBadRequestsChangeNothing) {
    // A planted link is read, then replaced, not written through.
    const std::string mine = "# mine\nMAILTO=\"\"\n15 3 * * 0 /usr/bin/backup\n";
    root_.WriteFile("/etc/victim", mine);
    ASSERT_EQ(symlink(root_.Path("/etc/victim").c_str(), root_.Path(kCrontab).c_str()), 0);
    ASSERT_EQ(VORNScheduleSet(kWifi, 127, 0, 23, 0), 0);
    EXPECT_EQ(root_.ReadFile("/etc/victim"), mine);
    ASSERT_EQ(VORNScheduleSet("/bin/true", 0x22, 8, 8, 30), 0);
    ASSERT_EQ(VORNScheduleSet(kWifi, 0x41, 6, 22, 5), 0);  // replaced in place
    const std::string expected = mine +
                                 "5 6-22 * * 0,6 /tmp/vornwireless.wlan0 --exec-schedule wlan0\n"
                                 "30 8 * * 1,5 /bin/true\n";
    EXPECT_EQ(root_.ReadFile(kCrontab), expected);
    struct stat info;
    ASSERT_EQ(lstat(root_.Path(kCrontab).c_str(), &info), 0);
    EXPECT_TRUE(S_ISREG(info.st_mode));
    EXPECT_EQ(info.st_mode & 07777, 0600u);

    for (const char* command :
         {"/bin/a %s", "/bin/a\n* * * * * /bin/b", "/bin/a\r", " /bin/a", ""}) {
        EXPECT_EQ(VORNScheduleSet(command, 127, 0, 23, 0), -1) << command;
    }
    EXPECT_EQ(VORNScheduleSet("/bin/a", 0, 0, 23, 0), -1);
    EXPECT_EQ(VORNScheduleSet("/bin/a", 128, 0, 23, 0), -1);
    EXPECT_EQ(VORNScheduleSet("/bin/a", 127, 0, 24, 0), -1);
    EXPECT_EQ(VORNScheduleSet("/bin/a", 127, 5, 4, 0), -1);
    EXPECT_EQ(VORNScheduleSet("/bin/a", 127, 0, 23, 60), -1);
    EXPECT_EQ(root_.ReadFile(kCrontab), expected);
    EXPECT_THAT(log_.Lines(), Contains(HasSubstr("which cron turns into a line break")));

    ASSERT_EQ(VORNScheduleRemove(kWifi), 0);
    EXPECT_EQ(VORNScheduleRemove(kWifi), 0);
    EXPECT_EQ(root_.ReadFile(kCrontab), mine + "30 8 * * 1,5 /bin/true\n");
}

}  // namespace
