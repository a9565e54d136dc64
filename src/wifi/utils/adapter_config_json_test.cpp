#include "wifi/utils/adapter_config_json.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <utility>

#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"
#include "wifi/settings/adapter_data.h"

namespace vornwireless {
namespace wifi {
namespace utils {
namespace {

class AdapterConfigJsonTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER);
        AdapterData* data = AdapterData::Create("wlan0");
        ASSERT_NE(data, nullptr);
        config_ = data->GetConfig();
        AdapterData::Delete(data);
        config_.security = WIFI_SECURITY_PERSONAL_WPA2;
        config_.password = std::string(64, 'a');
        config_.mac_filter_rules = {
            {true, vornwireless::utils::MacAddress("00:11:22:33:44:55"), "tv"}};
        AdapterConfig::StationInfo station;
        station.essid = std::string(32, 'e');
        station.bssid = vornwireless::utils::MacAddress("00:11:22:33:44:66");
        station.opmode = WIFI_OPMODE_MANAGED;
        station.security = WIFI_SECURITY_PERSONAL_WPA;
        station.password = "eight ch";
        config_.stations = {station, station};
        config_.stations[1].bssid = vornwireless::utils::MacAddress("00:11:22:33:44:77");
    }
    AdapterConfig config_;
};

TEST_F(AdapterConfigJsonTest, RoundTripAndRefusals) {
    const Json::Value json = GetJsonValue(config_);
    EXPECT_EQ(json["mode"], "gn");
    EXPECT_EQ(json["channel"], 0);
    EXPECT_EQ(json["clientenabled"], false);
    EXPECT_EQ(json["schedule"], std::string(168, '0'));
    EXPECT_EQ(json["stations"][0]["opmode"], "Any");
    EXPECT_EQ(json["mac_filter_rules"][0]["desc"], "tv");
    AdapterConfig built;
    ASSERT_EQ(GetConfig(json, built), 0);
    EXPECT_EQ(built, config_);

    using Change = std::function<void(Json::Value&)>;
    const std::pair<const char*, Change> refusals[] = {
        {"ssid", [](Json::Value& j) { j["ssid"] = "two\nlines"; }},
        {"ssid", [](Json::Value& j) { j["ssid"] = std::string(33, 's'); }},
        {"guest_ssid", [](Json::Value& j) { j["guest_ssid"] = std::string("nul\0x", 5); }},
        {"auth_server_shared_secret",
         [](Json::Value& j) { j["auth_server_shared_secret"] = "a\r"; }},
        {"password", [](Json::Value& j) { j["password"] = "short"; }},
        {"password", [](Json::Value& j) { j["password"] = std::string(63, 'p') + "\x7f"; }},
        {"guest_password",
         [](Json::Value& j) {
             j["guest_enabled"] = true;
             j["guest_security"] = "PERSONAL_WPA_MIXED";
         }},
        {"desc", [](Json::Value& j) { j["mac_filter_rules"][0]["desc"] = "a\nb"; }},
        {"mac", [](Json::Value& j) { j["mac_filter_rules"][0]["mac"] = "00:11:22:33:44"; }},
        {"bssid", [](Json::Value& j) { j["guest_bssid"] = "zz:11:22:33:44:55"; }},
        {"stations.essid",
         [](Json::Value& j) { j["stations"][0]["essid"] = std::string(33, 'e'); }},
        {"stations.user", [](Json::Value& j) { j["stations"][0]["user"] = "u\n"; }},
        {"stations.password", [](Json::Value& j) { j["stations"][1]["password"] = "1234567"; }},
        {"repeated", [](Json::Value& j) { j["stations"][1]["bssid"] = "001122334466"; }},
        {"[channel]", [](Json::Value& j) { j["channel"] = "6"; }},
        {"[tx_power]", [](Json::Value& j) { j["tx_power"] = "max"; }},
        {"[schedule]", [](Json::Value& j) { j["schedule"] = std::string(167, '1'); }},
        {"[enabled]", [](Json::Value& j) { j.removeMember("enabled"); }},
        {"[auth_server_ip]", [](Json::Value& j) { j["auth_server_ip"] = "10.0.0.256"; }},
        {"list", [](Json::Value& j) { j["stations"] = "none"; }},
        {"name", [](Json::Value& j) { j["name"] = "wlan0;reboot"; }},
    };
    for (const auto& refusal : refusals) {
        Json::Value changed = json;
        refusal.second(changed);
        log_.Clear();
        EXPECT_EQ(GetConfig(changed, built), -1) << refusal.first;
        EXPECT_TRUE(log_.Contains(refusal.first)) << refusal.first;
        EXPECT_EQ(built, config_) << refusal.first;
    }
    EXPECT_EQ(GetConfig(Json::Value("text"), built), -1);

    // One network alone, checked the same way.
    AdapterConfig::StationInfo station;
    ASSERT_EQ(ConnectionJsonToStationInfo(json["stations"][0], station), 0);
    EXPECT_EQ(station, config_.stations[0]);
    Json::Value hostile = json["stations"][0];
    hostile["user"] = "u\n";
    EXPECT_EQ(ConnectionJsonToStationInfo(hostile, station), -1);
    EXPECT_EQ(station, config_.stations[0]);
}

}  // namespace
}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless
