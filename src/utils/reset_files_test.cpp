#include "utils/reset_files.h"

#include <gtest/gtest.h>

#include "support/sim_root.h"

namespace vornwireless {
namespace utils {
namespace {

using ResetFilesTest = vorn::test::RootTest;

const char* const kFactory = "/usr/vorn/etc.defaults/wifi/wifi_topology_router";
const char* const kWorking = "/usr/vorn/etc/wifi/wifi_topology_router";

TEST_F(ResetFilesTest, PutsTheFactoryCopyBackOverTheWorkingOne) {
    root_.WriteFile(kFactory, "factory\n");
    root_.WriteFile(kWorking, "changed\n");
    ResetFiles(kFactory, kWorking);
    EXPECT_EQ(root_.ReadFile(kWorking), "factory\n");

    // Without a factory copy the working file is only removed.
    ResetFiles("/usr/vorn/etc.defaults/wifi/none", kWorking);
    EXPECT_FALSE(root_.Exists(kWorking));
    EXPECT_TRUE(log_.Matching(" Failed").empty());

    ResetFiles(kFactory, "/no/such/dir/wifi_topology_router");
    EXPECT_TRUE(log_.Contains("reset_files.cpp:"));
    EXPECT_TRUE(log_.Contains(" Failed to copy [" + std::string(kFactory) +
                              "] to [/no/such/dir/wifi_topology_router]"));
}

TEST_F(ResetFilesTest, RemovesTreesAndFilesAndWritesSwitches) {
    root_.WriteFile("/usr/vorn/etc/wifi/ap/wifi_ap_001122334455", "x");
    RemoveFiles("/usr/vorn/etc/wifi/ap");
    EXPECT_FALSE(root_.Exists("/usr/vorn/etc/wifi/ap"));
    RemoveFiles("/usr/vorn/etc/wifi/ap");
    // Patterns name every match, though no shell runs rm.
    root_.WriteFile("/usr/vorn/etc/wifi/wifi_ap_001122334455", "x");
    root_.WriteFile("/usr/vorn/etc/wifi/wifi_ap_00aabbccddee", "x");
    root_.WriteFile("/usr/vorn/etc/wifi/wifi_client_001122334455", "x");
    RemoveFiles("/usr/vorn/etc/wifi/wifi_ap_*");
    EXPECT_FALSE(root_.Exists("/usr/vorn/etc/wifi/wifi_ap_001122334455"));
    EXPECT_FALSE(root_.Exists("/usr/vorn/etc/wifi/wifi_ap_00aabbccddee"));
    EXPECT_TRUE(root_.Exists("/usr/vorn/etc/wifi/wifi_client_001122334455"));
    root_.WriteFile("/usr/vorn/etc.defaults/wifi/wifi_topology_bridge", "b\n");
    ResetFiles("/usr/vorn/etc.defaults/wifi/wifi_topology_*", "/usr/vorn/etc/wifi/wifi_topology_*");
    EXPECT_EQ(root_.ReadFile("/usr/vorn/etc/wifi/wifi_topology_bridge"), "b\n");
    root_.WriteFile("/tmp/one", "x");
    RemoveFile("/tmp/one");
    EXPECT_FALSE(root_.Exists("/tmp/one"));
    EXPECT_TRUE(log_.Lines().empty());

    root_.WriteFile("/proc/sys/net/ipv6/conf/all/forwarding", "0\n");
    EXPECT_TRUE(SetProcEntry("/proc/sys/net/ipv6/conf/all/forwarding", "1"));
    EXPECT_EQ(root_.ReadFile("/proc/sys/net/ipv6/conf/all/forwarding"), "1\n");
    EXPECT_FALSE(SetProcEntry("/proc/sys/net/ipv6/conf/none/forwarding", "1"));
    EXPECT_FALSE(root_.Exists("/proc/sys/net/ipv6/conf/none/forwarding"));
}

}  // namespace
}  // namespace utils
}  // namespace vornwireless
