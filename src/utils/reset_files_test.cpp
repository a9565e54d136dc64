#include "utils/reset_files.h"

#include <gtest/gtest.h>

#include <fstream>

#include "support/sim_root.h"

namespace vornwireless::utils {
namespace {

using ResetFilesTest = vorn::test::RootTest;

const std::string kFactory = "/usr/vorn/etc.defaults/wifi/wifi_topology_";
const std::string kWorking = "/usr/vorn/etc/wifi/wifi_topology_";

TEST_F(ResetFilesTest, PutsFactoryCopiesBackOrRemovesTheWorkingOnes) {
    root_.WriteFile(kFactory + "router", "factory\n");
    root_.WriteFile(kWorking + "router", "changed\n");
    ResetFiles((kFactory + "router").c_str(), (kWorking + "router").c_str());
    EXPECT_EQ(root_.ReadFile(kWorking + "router"), "factory\n");
    root_.WriteFile(kFactory + "bridge", "b\n");
    ResetFiles((kFactory + "*").c_str(), (kWorking + "*").c_str());
    EXPECT_EQ(root_.ReadFile(kWorking + "bridge"), "b\n");
    // Without a factory copy the working file is only removed.
    ResetFiles((kFactory + "none").c_str(), (kWorking + "router").c_str());
    EXPECT_FALSE(root_.Exists(kWorking + "router"));
    EXPECT_TRUE(log_.Lines().empty());
    ResetFiles((kFactory + "router").c_str(), "/no/such/dir/wifi_topology_router");
    EXPECT_TRUE(log_.Contains("reset_files.cpp:"));
    EXPECT_TRUE(log_.Contains(" Failed to copy [" + kFactory +
                              "router] to [/no/such/dir/wifi_topology_router]"));
}

TEST_F(ResetFilesTest, RemovesTreesAndFilesAndWritesSwitches) {
    root_.WriteFile("/usr/vorn/etc/wifi/ap/wifi_ap_001122334455", "x");
    RemoveFiles("/usr/vorn/etc/wifi/ap");
    EXPECT_FALSE(root_.Exists("/usr/vorn/etc/wifi/ap"));
    RemoveFiles("/usr/vorn/etc/wifi/ap");
    // Patterns name every match, though no shell runs rm.
    for (const char* name : {"wifi_ap_001122334455", "wifi_ap_00aabbccddee", "wifi_client_0011"}) {
        root_.WriteFile("/usr/vorn/etc/wifi/" + std::string(name), "x");
    }
    RemoveFiles("/usr/vorn/etc/wifi/wifi_ap_*");
    EXPECT_FALSE(root_.Exists("/usr/vorn/etc/wifi/wifi_ap_001122334455"));
    EXPECT_FALSE(root_.Exists("/usr/vorn/etc/wifi/wifi_ap_00aabbccddee"));
    EXPECT_TRUE(root_.Exists("/usr/vorn/etc/wifi/wifi_client_0011"));
    // A path is never a shell line: ";", "$( )" and blanks are only characters of a name.
    root_.WriteFile("/usr/vorn/etc/wifi/a b;touch x$(touch y)", "x");
    RemoveFiles("/usr/vorn/etc/wifi/a b;touch x$(touch y)");
    EXPECT_FALSE(root_.Exists("/usr/vorn/etc/wifi/a b;touch x$(touch y)"));
    EXPECT_FALSE(root_.Exists("/x") || root_.Exists("/y"));
    EXPECT_FALSE(std::ifstream("x").good() || std::ifstream("y").good());
    RemoveFile("/usr/vorn/etc/wifi/wifi_client_0011");
    EXPECT_FALSE(root_.Exists("/usr/vorn/etc/wifi/wifi_client_0011"));
    EXPECT_TRUE(log_.Lines().empty());

    root_.WriteFile("/proc/sys/net/ipv6/conf/all/forwarding", "0\n");
    EXPECT_TRUE(SetProcEntry("/proc/sys/net/ipv6/conf/all/forwarding", "1"));
    EXPECT_EQ(root_.ReadFile("/proc/sys/net/ipv6/conf/all/forwarding"), "1\n");
    EXPECT_FALSE(SetProcEntry("/proc/sys/net/ipv6/conf/none/forwarding", "1"));
    EXPECT_FALSE(root_.Exists("/proc/sys/net/ipv6/conf/none/forwarding"));
}

}  // namespace
}  // namespace vornwireless::utils
