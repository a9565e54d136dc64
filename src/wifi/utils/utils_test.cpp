#include "wifi/utils/utils.h"

#include <gtest/gtest.h>

#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"

namespace vornwireless {
namespace wifi {
namespace utils {
namespace {

using UtilsTest = vorn::test::RootTest;

TEST_F(UtilsTest, TopologyIsStoredAndCached) {
    root_.WriteFile("/etc/vorninfo.conf", "has_wifi_dongle=\"yes\"\n");
    EXPECT_EQ(ReadTopology(), WIFI_TOPOLOGY_CLIENT);
    EXPECT_EQ(root_.ReadFile("/etc/vorninfo.conf"),
              "has_wifi_dongle=\"yes\"\nnet_topology=\"client\"\n");
    ASSERT_EQ(WriteTopology(WIFI_TOPOLOGY_BRIDGE), 0);
    EXPECT_EQ(ReadTopology(), WIFI_TOPOLOGY_BRIDGE);
    root_.WriteFile("/etc/vorninfo.conf", "net_topology=\"mesh\"\n");
    EXPECT_EQ(ReadTopology(), WIFI_TOPOLOGY_ERROR);
    EXPECT_TRUE(log_.Contains("Failed to find key(mesh)"));

    // The process keeps the first good read; only a switch changes it.
    Adapter::SwitchTopology(WIFI_TOPOLOGY_ERROR);
    root_.WriteFile("/etc/vorninfo.conf", "net_topology=\"router\"\n");
    EXPECT_TRUE(Adapter::IsTopology(WIFI_TOPOLOGY_ROUTER));
    root_.WriteFile("/etc/vorninfo.conf", "net_topology=\"bridge\"\n");
    EXPECT_EQ(Adapter::GetTopology(), WIFI_TOPOLOGY_ROUTER);
    Adapter::SwitchTopology(WIFI_TOPOLOGY_CLIENT);
    EXPECT_EQ(Adapter::GetTopology(), WIFI_TOPOLOGY_CLIENT);
}

TEST_F(UtilsTest, NamesModelAndBuiltInRadio) {
    EXPECT_EQ(GetWirelessIndex("wlan12"), 12);
    EXPECT_EQ(GetGuestBridgeIndex("gbr1"), 1);
    for (const char* other : {"wlan", "wlan1x", "gbr-1", "wlan0 ", "xwlan0", "gbr99999"}) {
        EXPECT_EQ(GetWirelessIndex(other), -1) << other;
        EXPECT_EQ(GetGuestBridgeIndex(other), -1) << other;
    }
    EXPECT_EQ(GetBssid("wlan0"), "02:76:6f:72:6e:02");
    EXPECT_EQ(GetBssid("../eth0"), "");
    EXPECT_EQ(GetBssid("wlan9"), "");
    EXPECT_TRUE(log_.Contains("Failed to open [/sys/class/net/wlan9/address]"));

    EXPECT_FALSE(IsKiteModel());
    EXPECT_FALSE(IsGuestNetworkSupport("wlan0"));
    root_.WriteFile("/etc.defaults/vorninfo.conf",
                    "model=\"kite-a\"\nbuiltin_wlan_mac=\"02:76:6F:72:6E:02\"\n");
    EXPECT_TRUE(IsKiteBuiltInWlan("wlan0"));
    EXPECT_TRUE(IsKiteABuiltInWlan("wlan0"));
    EXPECT_FALSE(IsKiteBBuiltInWlan("wlan0"));
    EXPECT_FALSE(IsKiteBuiltInWlan("eth0"));
    EXPECT_EQ(GetKiteBWlanMacAddress(), "");
    EXPECT_TRUE(IsGuestNetworkSupport("wlan0"));
    EXPECT_FALSE(IsGuestNetworkSupport("wlan1"));
    root_.WriteFile("/etc.defaults/vorninfo.conf",
                    "model=\"kite-b\"\nbuiltin_wlan_mac=\"02:76:6f:72:6e:02\"\n");
    EXPECT_TRUE(IsKiteBBuiltInWlan("wlan0"));
    EXPECT_EQ(GetKiteBWlanMacAddress(), "02:76:6f:72:6e:02");
}

}  // namespace
}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless
