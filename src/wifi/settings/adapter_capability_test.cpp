#include "wifi/settings/adapter_capability.h"

#include <gmock/gmock.h>

#include <memory>
#include <string>
#include <vector>

#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"
#include "wifi/settings/adapter_capability_rlt.h"
#include "wifi/settings/adapter_data.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::HasSubstr;

using Capability = std::unique_ptr<AdapterCapability>;

class AdapterCapabilityTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER);
        root_.Scenario("iwconfig", "when wlan0\nprint wlan0     IEEE 802.11bgn  ESSID:off/any\n");
        std::unique_ptr<AdapterData> data(AdapterData::Create("wlan0"));
        ASSERT_TRUE(data);
        config_ = data->GetConfig();
    }
    // The log lines of one failed Verify, or "" when it passed.
    std::string Refusal(const AdapterCapability& capability, const AdapterConfig& config) {
        log_.Clear();
        const int result = capability.Verify(config);
        EXPECT_EQ(result == 0, log_.Lines().empty());
        return log_.Lines().empty() ? "" : log_.Lines().back();
    }
    AdapterConfig config_;
};

TEST_F(AdapterCapabilityTest, VerifyOrderAndLimits) {
    EXPECT_EQ(AdapterCapability::Create("wlan0';reboot'"), nullptr);
    Capability general(AdapterCapability::Create("wlan0"));
    EXPECT_EQ(general->GetMode(), (std::vector<WIFI_MODE>{WIFI_MODE_B, WIFI_MODE_G, WIFI_MODE_N,
                                                          WIFI_MODE_BN, WIFI_MODE_GN}));
    EXPECT_TRUE(general->GetFeature().empty());
    EXPECT_EQ(Refusal(*general, config_), "");

    AdapterConfig config = config_;
    config.max_num_client = 256;
    config.guest_max_num_client = 257;
    EXPECT_THAT(Refusal(*general, config), HasSubstr("Failed to verify guest max number client"));
    config.max_num_client = 257;
    EXPECT_THAT(Refusal(*general, config), HasSubstr("Failed to verify max number client"));
    config.guest_encryption = WIFI_ENCRYPTION_ERROR;
    EXPECT_THAT(Refusal(*general, config), HasSubstr("verify guest encryption"));
    config.tx_power = WIFI_POWER(5);
    config.security = WIFI_SECURITY_ERROR;
    EXPECT_THAT(Refusal(*general, config), HasSubstr("Failed to verify power"));
    config.bandwidth = WIFI_BANDWIDTH_20_40_80MHZ;
    EXPECT_THAT(Refusal(*general, config), HasSubstr("Failed to verify bandwidth"));
    config.mode = WIFI_MODE_BG;
    EXPECT_THAT(Refusal(*general, config), HasSubstr("Failed to verify mode"));

    // A station's mode is the remote network's business.
    Adapter::SwitchTopology(WIFI_TOPOLOGY_CLIENT);
    AdapterConfig station = config_;
    station.mode = WIFI_MODE_ERROR;
    EXPECT_EQ(Refusal(*general, station), "");
    Adapter::SwitchTopology(WIFI_TOPOLOGY_REPEATER);
    EXPECT_THAT(Refusal(*general, station), HasSubstr("Failed to verify topology"));
}

TEST_F(AdapterCapabilityTest, ModelRadiosChannelsAndFiveGigahertz) {
    // A cfg80211 radio names no letters to iwconfig; its bands in "iw phy" do.
    root_.Scenario("iwconfig", "when wlan0\nprint wlan0     IEEE 802.11  ESSID:off/any\n");
    root_.WriteFile("/sys/class/net/wlan0/phy80211/name", "phy0\n");
    root_.Scenario("iw", "when phy phy0 info\nprint \tBand 1:\nprint \t\t\tHT20/HT40\n");
    EXPECT_EQ(Capability(AdapterCapability::Create("wlan0"))->GetMode(),
              (std::vector<WIFI_MODE>{WIFI_MODE_B, WIFI_MODE_G, WIFI_MODE_N, WIFI_MODE_BN,
                                      WIFI_MODE_GN}));
    root_.Scenario("iwlist",
                   "when wlan0 active_channel\nprint wlan0     3 channels in total\n"
                   "print  Channel 1 : 2.412 GHz\nprint  Channel 11 : 2.462 GHz\n"
                   "print  Channel 36 : 5.18 GHz\n");
    EXPECT_EQ(Capability(AdapterCapability::Create("wlan0"))->GetChannel(),
              (std::vector<int>{1, 11, 36}));
    root_.WriteFile("/etc.defaults/vorninfo.conf", "model=\"kite-a\"\n");
    EXPECT_EQ(Capability(AdapterCapability::Create("wlan0"))->GetFeature().size(), 4u);

    root_.WriteFile("/etc.defaults/vorninfo.conf",
                    "model=\"kite-b\"\nbuiltin_wlan_mac=\"02:76:6f:72:6e:02\"\n");
    Capability rlt(AdapterCapability::Create("wlan0"));
    ASSERT_NE(dynamic_cast<AdapterCapabilityRLT*>(rlt.get()), nullptr);
    EXPECT_EQ(rlt->GetFeature().size(), 4u);
    const std::vector<int> channels = rlt->GetChannel();
    EXPECT_EQ(channels.front(), 1);
    EXPECT_EQ(channels[13], 36);
    EXPECT_EQ(channels.back(), 165);

    AdapterConfig config = config_;
    config.bandwidth = WIFI_BANDWIDTH_20_40_80MHZ;
    config.mode = WIFI_MODE_BN;
    EXPECT_THAT(Refusal(*rlt, config), HasSubstr("Failed to verify mode"));
    config.mode = WIFI_MODE_AN_AC;
    root_.ClearCalls();
    EXPECT_EQ(Refusal(*rlt, config), "");
    EXPECT_EQ(root_.Calls(), (std::vector<std::string>{"/sbin/iwlist wlan0 scanning"}));

    // A down radio is brought up for the scan; a failing scan refuses the 5 GHz mode.
    root_.WriteFile("/sys/class/net/wlan0/operstate", "down\n");
    root_.Scenario("iwlist", "when wlan0 scanning\nexit 1\n");
    root_.ClearCalls();
    EXPECT_THAT(Refusal(*rlt, config), HasSubstr("Failed to check and enable 5g mode for (wlan0)"));
    EXPECT_TRUE(log_.Contains("Failed to iwlist scanning for (wlan0)"));
    EXPECT_EQ(root_.Calls(), (std::vector<std::string>{"/sbin/ip link set dev wlan0 up",
                                                       "/sbin/iwlist wlan0 scanning"}));
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
