#include "wifi/settings/adapter_data.h"

#include <gmock/gmock.h>

#include <memory>
#include <string>
#include <utility>

#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::HasSubstr;

const std::string kAp = "/usr/vorn/etc/wifi/wifi_ap_02:76:6f:72:6e:02";
const std::string kClient = "/usr/vorn/etc/wifi/wifi_client_02:76:6f:72:6e:02";

struct DataDeleter {
    void operator()(AdapterData* data) const { AdapterData::Delete(data); }
};
using Data = std::unique_ptr<AdapterData, DataDeleter>;

class AdapterDataTest : public vorn::test::RootTest {
  protected:
    void SetUp() override { Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER); }

    void Radio(const std::string& phy) {
        root_.Scenario("iwconfig", "when wlan0\nprint wlan0     IEEE " + phy + "  ESSID:off/any\n");
    }

    static AdapterConfig::StationInfo Station(const std::string& bssid, WIFI_OPMODE opmode) {
        AdapterConfig::StationInfo station;
        station.essid = "net " + bssid;
        station.bssid = vornwireless::utils::MacAddress(bssid);
        station.opmode = opmode;
        station.security = WIFI_SECURITY_PERSONAL_WPA2;
        station.encryption = WIFI_ENCRYPTION_AES;
        station.password = "secret " + bssid;
        station.access_time = 1700000000;
        station.ip = vornwireless::utils::IPAddress("192.168.7.9");
        station.channel = 6;
        station.hwmode = WIFI_MODE_BGN;
        return station;
    }

    // Every field away from its default; eleven rules and stations out of name order.
    static AdapterConfig Full(AdapterConfig config) {
        config.ssid = "Home [1]=x";
        config.mode = WIFI_MODE_GN;
        config.channel = 11;
        config.schedule[3] = config.schedule[167] = true;
        config.CountryCode = "DE";
        config.security = WIFI_SECURITY_PERSONAL_WPA2;
        config.password = "pass=word;#1";
        config.auth_server_ip = vornwireless::utils::IPAddress("10.0.0.2");
        config.guest_password = "guestpass";
        config.mac_filter_policy = WIFI_MAC_FILTER_POLICY_ALLOW;
        for (int i = 0; i <= 10; ++i) {
            const std::string mac = "00:11:22:33:44:" + std::to_string(10 + i);
            config.mac_filter_rules.push_back(
                {i % 2 == 0, vornwireless::utils::MacAddress(mac), "rule " + std::to_string(i)});
        }
        config.client_enabled = true;
        config.stations = {Station("00:aa:00:00:00:09", WIFI_OPMODE_MANAGED),
                           Station("00:aa:00:00:00:01", WIFI_OPMODE_AD_HOC)};
        return config;
    }
};

TEST_F(AdapterDataTest, FirstStartMissingKeysAndModeProbe) {
    const std::pair<const char*, WIFI_MODE> probes[] = {{"802.11bgn", WIFI_MODE_N},
                                                        {"802.11an", WIFI_MODE_A},
                                                        {"802.11bg", WIFI_MODE_G},
                                                        {"802.11b", WIFI_MODE_B},
                                                        {"802.11", WIFI_MODE_GN}};
    for (const auto& probe : probes) {
        Radio(probe.first);
        Data data(AdapterData::Create("wlan0"));
        ASSERT_TRUE(data);
        EXPECT_EQ(data->GetConfig().mode, probe.second) << probe.first;
    }
    Data data(AdapterData::Create("wlan0"));
    // The guest network's address follows the radio's.
    EXPECT_EQ(data->GetConfig().guest_bssid.ToString(), "02:76:6f:72:6e:03");
    EXPECT_TRUE(data->NeedReload());
    EXPECT_FALSE(root_.Exists(kAp));

    root_.WriteFile(kAp, "[general]\n\tssid=Mine\n\tmode=bg\n");
    ASSERT_EQ(data->Read(), 0);
    EXPECT_EQ(data->GetConfig().ssid, "Mine");
    EXPECT_EQ(data->GetConfig().mode, WIFI_MODE_BG);
    EXPECT_EQ(data->GetConfig().security, WIFI_SECURITY_PERSONAL_WPA2);
    EXPECT_EQ(data->GetConfig().guest_security, WIFI_SECURITY_PERSONAL_WPA2);
    EXPECT_TRUE(data->GetConfig().client_enabled == false && data->GetConfig().stations.empty());
    EXPECT_EQ(AdapterData::Create("wlan7"), nullptr);
    EXPECT_TRUE(log_.Contains("Failed to get BSSID[wlan7]"));
}

TEST_F(AdapterDataTest, ReloadFlagsAndStationMerge) {
    Data data(AdapterData::Create("wlan0"));
    const auto flags = [&]() {
        const RELOAD_STATUS s = data->GetReloadStatus();
        data->ResetReloadStatus();
        return std::to_string(s.restart) + std::to_string(s.tx_power) + std::to_string(s.schedule) +
               std::to_string(s.guest_schedule) + std::to_string(s.guest_rule);
    };
    flags();
    AdapterConfig next = data->GetConfig();
    next.tx_power = WIFI_POWER_LOW;
    ASSERT_EQ(data->SetConfig(next), 0);
    EXPECT_EQ(flags(), "01000");
    next.schedule.fill(true);
    next.guest_schedule[5] = true;
    next.max_num_client = 3;
    data->SetConfig(next);
    EXPECT_EQ(flags(), "00000");
    EXPECT_TRUE(data->GetConfig().schedule[100]);
    next.guest_enabled = true;
    data->SetConfig(next);
    EXPECT_EQ(flags(), "10001");
    next.schedule_enabled = true;
    next.guest_allow_access_lan = true;
    next.mac_filter_rules.push_back({true, vornwireless::utils::MacAddress("001122334455"), ""});
    next.stations = {Station("00:aa:00:00:00:01", WIFI_OPMODE_MANAGED),
                     Station("00:aa:00:00:00:02", WIFI_OPMODE_MANAGED)};
    data->SetConfig(next);
    EXPECT_EQ(flags(), "10101");

    // A client takes the first new station, in place of a known one of the same BSSID.
    Adapter::SwitchTopology(WIFI_TOPOLOGY_CLIENT);
    next.stations = {Station("00:aa:00:00:00:01", WIFI_OPMODE_AD_HOC),
                     Station("00:aa:00:00:00:03", WIFI_OPMODE_MANAGED)};
    data->SetConfig(next);
    next.stations = {Station("00:aa:00:00:00:04", WIFI_OPMODE_MANAGED)};
    data->SetConfig(next);
    const auto& known = data->GetConfig().stations;
    ASSERT_EQ(known.size(), 3u);
    EXPECT_EQ(known[0].bssid.ToString(), "00:aa:00:00:00:02");
    EXPECT_EQ(known[1].bssid.ToString(), "00:aa:00:00:00:01");
    EXPECT_EQ(known[1].opmode, WIFI_OPMODE_AD_HOC);
    next.stations.clear();
    EXPECT_EQ(data->SetClientConfig(next), -1);
    EXPECT_TRUE(log_.Contains("stationList is null"));

    Adapter::SwitchTopology(WIFI_TOPOLOGY_REPEATER);
    EXPECT_EQ(data->SetConfig(next), -1);
    EXPECT_TRUE(log_.Contains("Bad topology [4]"));
}

TEST_F(AdapterDataTest, WriteAndReadBackPerTopology) {
    Data data(AdapterData::Create("wlan0"));
    const AdapterConfig full = Full(data->GetConfig());
    Adapter::SwitchTopology(WIFI_TOPOLOGY_REPEATER);
    data->Write();
    EXPECT_FALSE(root_.Exists(kAp) || root_.Exists(kClient));

    Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER);
    data->SetConfig(full);
    ASSERT_EQ(data->Write(), 0);
    const std::string ap = root_.ReadFile(kAp);
    EXPECT_EQ(ap.find("pass=word"), std::string::npos);
    EXPECT_EQ(ap.find("[general]\n\tbssid=02:76:6f:72:6e:02\n\tdriver=nl80211\n\tenabled=yes\n"),
              0u);
    EXPECT_EQ(root_.ReadFile("/etc/hostapd/mac_filter/mf.info"), "policy=allow\n");
    const std::string rules = root_.ReadFile("/etc/hostapd/mac_filter/mf.conf");
    EXPECT_LT(rules.find("[2]"), rules.find("[10]"));
    const std::string client = root_.ReadFile(kClient);
    EXPECT_EQ(client.find("[general]\n\tclientenabled=yes\n[00:aa:00:00:00:09]\n\tessid="), 0u);
    EXPECT_THAT(client, HasSubstr("\topmode=Any\n"));
    EXPECT_THAT(client, HasSubstr("\topmode=Ad\n"));
    Data reread(AdapterData::Create("wlan0"));
    ASSERT_TRUE(reread);
    EXPECT_EQ(reread->GetConfig(), full);

    // Client topology writes the known networks only.
    AdapterConfig station = full;
    station.stations = {Station("00:aa:00:00:00:05", WIFI_OPMODE_MANAGED)};
    Adapter::SwitchTopology(WIFI_TOPOLOGY_CLIENT);
    data->SetConfig(station);
    data->Write();
    EXPECT_EQ(root_.ReadFile(kAp), ap);
    EXPECT_EQ(root_.ReadFile("/etc/hostapd/mac_filter/mf.conf"), rules);
    reread.reset(AdapterData::Create("wlan0"));
    ASSERT_TRUE(reread);
    EXPECT_EQ(reread->GetConfig().stations, data->GetConfig().stations);
    EXPECT_EQ(reread->GetConfig().stations.size(), 3u);
}

TEST_F(AdapterDataTest, DamagedFilesAreNotUsed) {
    Data data(AdapterData::Create("wlan0"));
    const AdapterConfig full = Full(data->GetConfig());
    data->SetConfig(full);
    data->Write();
    const std::string ap = root_.ReadFile(kAp);
    const std::string client = root_.ReadFile(kClient);
    const auto replace = [](std::string text, const std::string& from, const std::string& to) {
        return text.replace(text.find(from), from.size(), to);
    };
    const std::string schedule = std::string(3, '0') + '1';
    const struct {
        std::string file, content, line;
    } damages[] = {
        {kAp, replace(ap, "security=PERSONAL_WPA2", "security=WPA3"), "Failed to find key(WPA3)"},
        {kAp, replace(ap, "channel=11", "channel=11a"), "Bad value [11a] of key [channel]"},
        {kAp, replace(ap, "schedule=" + schedule, "schedule=" + schedule + "1"), "schedule]"},
        {kAp, replace(ap, "schedule=000", "schedule=0x0"), "schedule]"},
        {kAp, replace(ap, "password=vc1:", "password=vc1:0"), "Failed to decrypt cipher text"},
        {kAp, "[other]\n\tssid=x\n", "Failed to get AP value"},
        {kClient, replace(client, "password=vc1:", "password=vc2:"), "Failed to get Client value"},
        {kClient, client + "[nomac]\n\tessid=x\n", "Failed to get Client value"},
        {"/etc/hostapd/mac_filter/mf.conf", "[0]\n\tmac=00:11\n", "Failed to get MacFilter value"},
    };
    for (const auto& damage : damages) {
        const std::string before = root_.ReadFile(damage.file);
        root_.WriteFile(damage.file, damage.content);
        log_.Clear();
        EXPECT_EQ(data->Read(), -1) << damage.line;
        EXPECT_TRUE(log_.Contains(damage.line)) << damage.line;
        EXPECT_TRUE(log_.Contains("Failed to get Config value"));
        EXPECT_EQ(data->GetConfig(), full);
        root_.WriteFile(damage.file, before);
    }
    // A repeated section reads as one: the later value of a key wins.
    root_.WriteFile(kAp, ap + "[general]\n\tchannel=3\n");
    ASSERT_EQ(data->Read(), 0);
    EXPECT_EQ(data->GetConfig().channel, 3);
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
