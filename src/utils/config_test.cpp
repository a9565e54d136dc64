#include "utils/config.h"

#include <dirent.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <string>
#include <vector>

#include "support/sim_root.h"

namespace vornwireless {
namespace utils {
namespace {

class ConfigTest : public vorn::test::RootTest {
  protected:
    // Files of a directory whose names start with prefix (temporary files left behind).
    std::vector<std::string> Leftovers(const std::string& dir, const std::string& prefix) {
        std::vector<std::string> found;
        DIR* handle = opendir(root_.Path(dir).c_str());
        if (handle == nullptr) {
            return found;
        }
        while (const dirent* entry = readdir(handle)) {
            if (std::string(entry->d_name).rfind(prefix, 0) == 0) {
                found.push_back(entry->d_name);
            }
        }
        closedir(handle);
        return found;
    }
};

TEST_F(ConfigTest, SectionsWriteInOrderAndReadBack) {
    ConfigSection config("/usr/vorn/etc/wifi/new/wifi_ap_001122334455");
    config.AddKeyValue("wlan0", "ssid", "Vorn");
    config.AddKeyValue("wlan0", "enable", true);
    config.AddKeyValue("wlan0", "hidden", false);
    config.AddKeyValue("wlan0", "channel", -6);
    config.AddKeyValue("wlan0", "ratio", 0.1);
    config.AddKeyValue("wlan0", "whole", 2.0);
    config.AddKeyValue("wlan0", "big", 1234567.0);
    config.AddKeyValue("guest", "ssid", std::string("Guest"));
    ASSERT_EQ(config.Write(), 0);

    EXPECT_EQ(root_.ReadFile("/usr/vorn/etc/wifi/new/wifi_ap_001122334455"),
              "[guest]\n\tssid=Guest\n"
              "[wlan0]\n\tbig=1.23457e+06\n\tchannel=-6\n\tenable=yes\n\thidden=no\n\tratio=0.1\n"
              "\tssid=Vorn\n\twhole=2\n");
    struct stat info;
    ASSERT_EQ(stat(root_.Path("/usr/vorn/etc/wifi/new").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0755u);
    // A new file is readable by all; a replaced one keeps its mode.
    ASSERT_EQ(stat(root_.Path(config.GetNameString()).c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0644u);
    chmod(root_.Path(config.GetNameString()).c_str(), 0640);
    ASSERT_EQ(config.Write(), 0);
    ASSERT_EQ(stat(root_.Path(config.GetNameString()).c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0640u);
    EXPECT_TRUE(Leftovers("/usr/vorn/etc/wifi/new", "wifi_ap_001122334455.tmp.").empty());

    ConfigSection reread(config.GetNameString());
    ASSERT_EQ(reread.Read(), 0);
    EXPECT_EQ(reread.GetKeyValues(), config.GetKeyValues());
    EXPECT_EQ(reread.GetDirName(), "/usr/vorn/etc/wifi/new");
    EXPECT_EQ(ConfigSection("plain").GetDirName(), ".");
}

TEST_F(ConfigTest, InsertOnReadAndSectionDeletion) {
    ConfigSection config("/etc/iproute2/config/gateway_database");
    config.AddKeyValue("eth0", "gateway", "10.0.0.1");
    EXPECT_EQ(config.GetKeyValue("eth0", "dns"), "");
    EXPECT_EQ(config.GetKeyValue("wlan0", "gateway"), "");
    EXPECT_TRUE(config.Find("wlan0"));
    EXPECT_EQ(config.DeleteSection("none"), 0);
    ASSERT_EQ(config.Write(), 0);
    EXPECT_EQ(root_.ReadFile(config.GetNameString()),
              "[eth0]\n\tdns=\n\tgateway=10.0.0.1\n[wlan0]\n\tgateway=\n");
    EXPECT_EQ(config.DeleteSection("wlan0"), 1);
    EXPECT_FALSE(config.Find("wlan0"));
    EXPECT_FALSE(config.Empty());

    ConfigSection empty("/etc/empty.conf");
    ASSERT_EQ(empty.Write(), 0);
    EXPECT_EQ(root_.ReadFile("/etc/empty.conf"), "");
}

TEST_F(ConfigTest, FailedReadsKeepWhatWasInMemory) {
    ConfigSection config("/etc/missing.conf");
    config.AddKeyValue("keep", "k", "v");
    EXPECT_EQ(config.Read(), -1);
    EXPECT_TRUE(log_.Contains("config.cpp:"));
    EXPECT_TRUE(log_.Contains("[/etc/missing.conf] does not exist"));
    EXPECT_EQ(config.GetKeyValue("keep", "k"), "v");

    // A section without keys fails the read; the sections before it are in memory.
    root_.WriteFile("/etc/part.conf", "[a]\nk=1\n[b]\n[c]\nk=3\n");
    config.SetName("/etc/part.conf");
    EXPECT_EQ(config.Read(), -1);
    EXPECT_TRUE(log_.Contains("Failed to get section [b] in [/etc/part.conf]"));
    EXPECT_EQ(config.GetKeyValue("a", "k"), "1");
    EXPECT_TRUE(config.Find("keep"));
    EXPECT_FALSE(config.Find("c"));

    root_.WriteFile("/etc/bad.conf", std::string("[a]\nk=\0\n", 8));
    config.SetName("/etc/bad.conf");
    EXPECT_EQ(config.Read(), -1);
    EXPECT_TRUE(log_.Contains("Failed to enum sections in [/etc/bad.conf]"));
}

TEST_F(ConfigTest, FailedWriteLeavesThePreviousFileWhole) {
    const std::string name = "/etc/iproute2/config/gateway_v4_priority";
    root_.WriteFile(name, "[0]\n\tifname=eth0\n");
    ConfigSection config(name);
    config.AddKeyValue("0", "ifname", "eth1");
    config.AddKeyValue("1", "ifname", "two\nlines");
    EXPECT_EQ(config.Write(), -1);
    EXPECT_TRUE(log_.Contains("Failed to add section [1] in [" + name + "]"));
    EXPECT_TRUE(log_.Contains("Failed to create a temoprary file for [" + name + "]"));
    EXPECT_EQ(root_.ReadFile(name), "[0]\n\tifname=eth0\n");
    EXPECT_TRUE(Leftovers("/etc/iproute2/config", "gateway_v4_priority.tmp.").empty());

    // A directory that cannot be made.
    root_.WriteFile("/etc/blocker", "");
    ConfigSection blocked("/etc/blocker/sub/file");
    EXPECT_EQ(blocked.Write(), -1);
    EXPECT_TRUE(log_.Contains("Failed to check and make [/etc/blocker/sub]"));
}

TEST_F(ConfigTest, FlatFilesRoundTrip) {
    root_.WriteFile("/etc/flat.conf", "# c\nb=\"quoted\"\na=1\n");
    ConfigNoSection config("/etc/flat.conf");
    ASSERT_EQ(config.Read(), 0);
    EXPECT_EQ(config.GetKeyValue("b"), "quoted");
    EXPECT_EQ(config.GetKeyValue("missing"), "");
    config.AddKeyValue("c", true);
    config.AddKeyValue("d", 7);
    ASSERT_EQ(config.Write(), 0);
    EXPECT_EQ(root_.ReadFile("/etc/flat.conf"), "a=1\nb=quoted\nc=yes\nd=7\nmissing=\n");

    ConfigNoSection missing("/etc/none.conf");
    EXPECT_EQ(missing.Read(), -1);
    EXPECT_TRUE(missing.GetKeyValues().empty());
}

}  // namespace
}  // namespace utils
}  // namespace vornwireless
