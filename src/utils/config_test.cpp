#include "utils/config.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <iterator>

#include "support/sim_root.h"

namespace vornwireless::utils {
namespace {

class ConfigTest : public vorn::test::RootTest {
  protected:
    mode_t Mode(const std::string& logical) const {
        struct stat info {};
        stat(root_.Path(logical).c_str(), &info);
        return info.st_mode & 0777;
    }
    // Temporary files left behind show up as extra entries.
    long Entries(const std::string& dir) const {
        namespace fs = std::filesystem;
        return std::distance(fs::directory_iterator(root_.Path(dir)), fs::directory_iterator());
    }
};

TEST_F(ConfigTest, SectionsWriteInOrderAndReadBack) {
    const std::string dir = "/usr/vorn/etc/wifi/new";
    ConfigSection config(dir + "/wifi_ap_001122334455");
    config.AddKeyValue("wlan0", "ssid", "Vorn");
    config.AddKeyValue("wlan0", "enable", true);
    config.AddKeyValue("wlan0", "hidden", false);
    config.AddKeyValue("wlan0", "channel", -6);
    config.AddKeyValue("wlan0", "ratio", 0.1);
    config.AddKeyValue("wlan0", "whole", 2.0);
    config.AddKeyValue("wlan0", "big", 1234567.0);
    config.AddKeyValue("guest", "ssid", std::string("Guest"));
    EXPECT_EQ(config.GetKeyValue("lan", "dns"), "");  // inserted, and written
    ASSERT_EQ(config.Write(), 0);
    EXPECT_EQ(root_.ReadFile(config.GetNameString()),
              "[guest]\n\tssid=Guest\n[lan]\n\tdns=\n"
              "[wlan0]\n\tbig=1.23457e+06\n\tchannel=-6\n\tenable=yes\n\thidden=no\n\tratio=0.1\n"
              "\tssid=Vorn\n\twhole=2\n");
    // A new file is readable by all; a replaced one keeps its mode.
    EXPECT_EQ(Mode(config.GetNameString()), 0644u);
    chmod(root_.Path(config.GetNameString()).c_str(), 0640);
    ASSERT_EQ(config.Write(), 0);
    EXPECT_EQ(Mode(config.GetNameString()), 0640u);
    EXPECT_EQ(Entries(dir), 1);

    ConfigSection reread(config.GetNameString());
    ASSERT_EQ(reread.Read(), 0);
    EXPECT_EQ(reread.GetKeyValues(), config.GetKeyValues());
    EXPECT_EQ(reread.GetDirName(), dir);
    EXPECT_EQ(reread.DeleteSection("none"), 0);
    EXPECT_EQ(reread.DeleteSection("lan"), 1);
    EXPECT_FALSE(reread.Find("lan") || reread.Empty());
    ConfigSection empty("/etc/empty.conf");
    ASSERT_EQ(empty.Write(), 0);
    EXPECT_EQ(root_.ReadFile("/etc/empty.conf"), "");
}

TEST_F(ConfigTest, FailedReadsKeepWhatWasInMemoryAndFailedWritesTheFile) {
    ConfigSection config("/etc/missing.conf");
    config.AddKeyValue("keep", "k", "v");
    EXPECT_EQ(config.Read(), -1);
    EXPECT_TRUE(log_.Contains("config.cpp:"));
    EXPECT_TRUE(log_.Contains("[/etc/missing.conf] does not exist"));
    // A section without keys fails the read; the sections before it are in memory.
    root_.WriteFile("/etc/part.conf", "[a]\nk=1\n[b]\n[c]\nk=3\n");
    config.SetName("/etc/part.conf");
    EXPECT_EQ(config.Read(), -1);
    EXPECT_TRUE(log_.Contains("Failed to get section [b] in [/etc/part.conf]"));
    EXPECT_EQ(config.GetKeyValue("a", "k"), "1");
    EXPECT_EQ(config.GetKeyValue("keep", "k"), "v");
    EXPECT_FALSE(config.Find("c"));

    const std::string name = "/etc/iproute2/config/gateway_v4_priority";
    root_.WriteFile(name, "[0]\n\tifname=eth0\n");
    const long entries = Entries("/etc/iproute2/config");
    ConfigSection refused(name);
    refused.AddKeyValue("0", "ifname", "eth1");
    refused.AddKeyValue("1", "ifname", "two\nlines");
    EXPECT_EQ(refused.Write(), -1);
    EXPECT_TRUE(log_.Contains("Failed to add section [1] in [" + name + "]"));
    EXPECT_TRUE(log_.Contains("Failed to create a temoprary file for [" + name + "]"));
    EXPECT_EQ(root_.ReadFile(name), "[0]\n\tifname=eth0\n");
    EXPECT_EQ(Entries("/etc/iproute2/config"), entries);
    root_.WriteFile("/etc/blocker", "");
    EXPECT_EQ(ConfigSection("/etc/blocker/sub/file").Write(), -1);
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
}  // namespace vornwireless::utils
