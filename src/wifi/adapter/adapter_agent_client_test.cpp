#include "wifi/adapter/adapter_agent_client.h"

#include <gmock/gmock.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <tuple>

#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"
#include "wifi/adapter/adapter_agent_client_rlt.h"
#include "wifi/utils/station_utils.h"

extern char** environ;

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using StationInfo = AdapterConfig::StationInfo;

StationInfo Network(WIFI_SECURITY security, WIFI_ENCRYPTION encryption,
                    const std::string& password) {
    StationInfo station;
    station.essid = "home";
    station.bssid = vornwireless::utils::MacAddress("02:00:00:00:00:01");
    station.opmode = WIFI_OPMODE_MANAGED;
    station.security = security;
    station.encryption = encryption;
    station.user = "ann";
    station.password = password;
    station.is_dhcp = true;
    return station;
}

// The security lines: what follows "scan_ssid=1".
std::string SecurityLines(const StationInfo& station) {
    std::string text;
    if (AdapterAgentClient::WpaSupplicantConfigText(station, text) != 0) {
        return "refused";
    }
    const std::string::size_type start = text.find("scan_ssid=1\n");
    return text.substr(start + 12, text.size() - start - 14);
}

class AdapterAgentClientTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        AdapterAgentClientBase::SetPollInterval(std::chrono::milliseconds(1));
        setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nonexistent/vorn-dead-bus", 1);
        root_.Scenario("iwconfig", "when wlan0\nprint wlan0     IEEE 802.11bgn  ESSID:off/any\n");
        root_.Scenario("ip",
                       "when -4 -o addr show dev wlan0\n"
                       "print 3: wlan0    inet 192.168.1.50/24 scope global wlan0\n");
    }
    void TearDown() override { AdapterAgentClientBase::SetPollInterval(std::chrono::seconds(1)); }

    long CallsStartingWith(const std::string& prefix) const {
        const auto calls = root_.Calls();
        return std::count_if(calls.begin(), calls.end(), [&prefix](const std::string& call) {
            return call.compare(0, prefix.size(), prefix) == 0;
        });
    }

    vorn::test::SavedVariable bus_{"DBUS_SESSION_BUS_ADDRESS"};
    AdapterAgentClient agent_{"wlan0"};
};

TEST_F(AdapterAgentClientTest, SupplicantFileBySecurityAndRefusedTexts) {
    StationInfo open = Network(WIFI_SECURITY_DISABLED, WIFI_ENCRYPTION_NONE, "");
    open.bssid = vornwireless::utils::MacAddress("00:00:00:00:00:00");
    open.opmode = WIFI_OPMODE_AD_HOC;
    std::string text;
    ASSERT_EQ(AdapterAgentClient::WpaSupplicantConfigText(open, text), 0);
    EXPECT_EQ(text,
              "ctrl_interface=/var/run/wpa_supplicant\nnetwork={\n\tssid=\"home\"\n"
              "\tscan_ssid=1\n\tmode=1\n\tkey_mgmt=NONE\n}\n");
    const std::string wepTail = "\twep_tx_keyidx=0\n\tauth_alg=OPEN SHARED\n";
    EXPECT_EQ(SecurityLines(Network(WIFI_SECURITY_WEP, WIFI_ENCRYPTION_NONE, "ab\\cd")),
              "\tkey_mgmt=NONE\n\twep_key0=\"ab\\cd\"\n" + wepTail);
    EXPECT_EQ(SecurityLines(Network(WIFI_SECURITY_WEP, WIFI_ENCRYPTION_NONE, "0123456789")),
              "\tkey_mgmt=NONE\n\twep_key0=0123456789\n" + wepTail);
    EXPECT_EQ(SecurityLines(Network(WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES, "secret99")),
              "\tkey_mgmt=WPA-PSK\n\tpairwise=CCMP\n\tpsk=\"secret99\"\n");
    const std::string hexKey(64, 'a');
    EXPECT_EQ(
        SecurityLines(Network(WIFI_SECURITY_PERSONAL_WPA_MIXED, WIFI_ENCRYPTION_TKIP_AES, hexKey)),
        "\tkey_mgmt=WPA-PSK\n\tpairwise=TKIP CCMP\n\tpsk=" + hexKey + "\n");
    EXPECT_EQ(SecurityLines(Network(WIFI_SECURITY_ENTERPRISE_WPA, WIFI_ENCRYPTION_TKIP, "pw")),
              "\tkey_mgmt=WPA-EAP\n\teap=TTLS PEAP\n\tpairwise=TKIP\n\tidentity=\"ann\"\n"
              "\tpassword=\"pw\"\n");
    // Hostile names and passwords: the configuration fuzz target and the supplicant's own parser.
    for (const StationInfo& refused :
         {Network(WIFI_SECURITY_WEP, WIFI_ENCRYPTION_NONE, "123456789012"),
          Network(WIFI_SECURITY_WEP, WIFI_ENCRYPTION_NONE, "ghijklmnop"),
          Network(WIFI_SECURITY_PERSONAL_WPA, WIFI_ENCRYPTION_NONE, "secret99"),
          Network(WIFI_SECURITY_PERSONAL_WPA, WIFI_ENCRYPTION_AES, "secret\"99"),
          Network(WIFI_SECURITY_ERROR, WIFI_ENCRYPTION_AES, "secret99")}) {
        EXPECT_EQ(SecurityLines(refused), "refused") << refused.password;
    }
    for (const char* message :
         {"Wrong WEP Format.", "Unknown encryption [1] for personal security [3]",
          "Failed to detect authentication/encryption type"}) {
        EXPECT_TRUE(log_.Contains(message)) << message;
    }
    // A refused network leaves the file as it was.
    root_.WriteFile(AdapterAgentClient::ConfigFile("wlan0"), "before\n");
    AdapterConfig config;
    config.stations = {Network(WIFI_SECURITY_PERSONAL_WPA, WIFI_ENCRYPTION_AES, "a\"b")};
    ASSERT_EQ(agent_.GetClientConfig(config), 0);
    EXPECT_EQ(agent_.DoConnecting(), -1);
    EXPECT_EQ(root_.ReadFile(AdapterAgentClient::ConfigFile("wlan0")), "before\n");
    EXPECT_THAT(root_.Calls(), ::testing::IsEmpty());
}

// Ranges, hex names and addresses of hostile listings are the scan fuzz target's.
TEST_F(AdapterAgentClientTest, ScanWordsAndListing) {
    const std::pair<const char*, std::pair<WIFI_SECURITY, WIFI_ENCRYPTION>> words[] = {
        {"WPA1WPA2PSKTKIPAES", {WIFI_SECURITY_PERSONAL_WPA_MIXED, WIFI_ENCRYPTION_TKIP_AES}},
        {"WEP", {WIFI_SECURITY_WEP, WIFI_ENCRYPTION_NONE}},
        {"WPA2EAPAES", {WIFI_SECURITY_ENTERPRISE_WPA2, WIFI_ENCRYPTION_AES}},
        {"PSKAES", {WIFI_SECURITY_ERROR, WIFI_ENCRYPTION_ERROR}}};
    for (const auto& [word, expected] : words) {
        std::pair<WIFI_SECURITY, WIFI_ENCRYPTION> parsed{WIFI_SECURITY_ERROR,
                                                         WIFI_ENCRYPTION_ERROR};
        const int result =
            AdapterAgentClientBase::ParseSecurityEncryption(word, parsed.first, parsed.second);
        EXPECT_EQ(result, expected.first == WIFI_SECURITY_ERROR ? -1 : 0) << word;
        EXPECT_TRUE(result != 0 || parsed == expected) << word;
    }

    root_.Scenario("iwlist",
                   "when wlan0 scanning vorn\n"
                   "print 02:00:00:00:00:01 6 80 Managed bgn WPA2PSKAES 686f6d65\n"
                   "print 02:00:00:00:00:02 1 30 Ad g NONE 782209\n"
                   "print 02:00:00:00:00:03 6 80 Managed bgn WPA2PSKAES 686f6d65 extra\n"
                   "print 02:00:00:00:00:05 6 80 Weird bgn WPA2PSKAES 686f6d65\n"
                   "print 02:00:00:00:00:07 6 80 Managed bgn WPA2PSK 686f6d65\n");
    std::vector<StationInfo> found;
    ASSERT_EQ(agent_.QuickScanNetworks(AdapterConfig(), found), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre("/sbin/iwlist wlan0 scanning vorn"));
    ASSERT_EQ(found.size(), 2u);
    EXPECT_EQ(std::make_tuple(found[0].essid, found[0].bssid.ToString(), found[0].channel,
                              found[0].signal, found[0].opmode, found[0].hwmode, found[0].security),
              std::make_tuple(std::string("home"), std::string("02:00:00:00:00:01"), 6, 80,
                              WIFI_OPMODE_MANAGED, WIFI_MODE_BGN, WIFI_SECURITY_PERSONAL_WPA2));
    EXPECT_EQ(std::make_tuple(found[1].essid, found[1].opmode, found[1].security),
              std::make_tuple(std::string("x\"\t"), WIFI_OPMODE_AD_HOC, WIFI_SECURITY_DISABLED));
    EXPECT_TRUE(log_.Contains("Failed on parsing security and encryption from string [WPA2PSK]"));
}

TEST_F(AdapterAgentClientTest, ConnectGivesUpAfterFifteenPollsAndThenAddressesAreChecked) {
    // A supplicant that ignores wpa_cli, as a hung one would.
    const std::string program = root_.Path("/tmp/wpa_supplicant");
    ASSERT_EQ(symlink("/bin/sleep", program.c_str()), 0);
    pid_t hung = 0;
    char* argv[] = {const_cast<char*>(program.c_str()), const_cast<char*>("30"), nullptr};
    ASSERT_EQ(posix_spawn(&hung, program.c_str(), nullptr, nullptr, argv, environ), 0);
    root_.WriteFile(AdapterAgentClient::PidFile("wlan0"), std::to_string(hung) + "\n");
    root_.Scenario("wpa_cli", "when -i wlan0 status\nprint wpa_state=SCANNING\n");
    AdapterConfig config;
    config.client_enabled = true;
    config.stations = {Network(WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES, "secret99")};
    ASSERT_EQ(agent_.GetClientConfig(config), 0);

    EXPECT_EQ(agent_.DoConnecting(), -1);
    EXPECT_EQ(CallsStartingWith("/usr/sbin/wpa_cli -i wlan0 status"), 15);
    EXPECT_EQ(CallsStartingWith("/usr/sbin/wpa_cli -i wlan0 terminate"), 1 + 3);
    EXPECT_EQ(CallsStartingWith("/usr/sbin/wpa_supplicant -Dwext -i wlan0 -c "), 1);
    EXPECT_TRUE(log_.Contains("Time out to connect AP, kill wpa_supplicant."));
    int status = 0;
    EXPECT_TRUE(vorn::test::WaitFor([&] { return waitpid(hung, &status, WNOHANG) == hung; }));
    EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGKILL);
    EXPECT_FALSE(root_.Exists(AdapterAgentClient::PidFile("wlan0")));

    // Associated: the reconnection watcher starts and DHCP gives the address.
    root_.Scenario("wpa_cli",
                   "when -i wlan0 status\nprint bssid=02:00:00:00:00:01\n"
                   "print ssid=home\nprint wpa_state=COMPLETED\n"
                   "print ip_address=192.168.1.50\n");
    root_.ClearCalls();
    EXPECT_EQ(agent_.DoConnecting(), 0);
    EXPECT_TRUE(vorn::test::WaitFor(
        [this] { return CallsStartingWith("/usr/sbin/wpa_cli -i wlan0 -a") == 1; }));
    EXPECT_EQ(CallsStartingWith("/etc/rc.network restart-if wlan0"), 1);
    EXPECT_EQ(agent_.GetStatus(config), WIFI_STATUS_ENABLED);
    config.name = "wlan0";
    Json::Value info;
    ASSERT_EQ(utils::GetConnectedAPInfo(config, info), 0);
    EXPECT_EQ(info["essid"], "home");
    EXPECT_EQ(info["security"], "PERSONAL_WPA2");
    EXPECT_EQ(info["ip"], "192.168.1.50");
    EXPECT_EQ(info["password"], "");

    // A static address another host answers for is not taken; an ad-hoc network then draws one.
    root_.Scenario("arping", "when *192.168.1.77\nexit 1\n");
    config.stations[0].is_dhcp = false;
    config.stations[0].ip = "192.168.1.77";
    config.stations[0].netmask = "255.255.255.0";
    ASSERT_EQ(agent_.GetClientConfig(config), 0);
    EXPECT_EQ(agent_.DoConnecting(), -1);
    EXPECT_TRUE(log_.Contains("IP [192.168.1.77] is used by other host, conflict"));
    EXPECT_EQ(agent_.GetStatus(config), WIFI_STATUS_IPCONFLICT);
    config.stations[0].opmode = WIFI_OPMODE_AD_HOC;
    ASSERT_EQ(agent_.GetClientConfig(config), 0);
    EXPECT_EQ(agent_.DoConnecting(), 0);
    EXPECT_TRUE(log_.Contains("IP setting for adhoc failed, random generate one to use"));
    EXPECT_THAT(root_.ReadFile("/etc/sysconfig/network-scripts/ifcfg-wlan0"),
                ::testing::ContainsRegex("IPADDR=\"?10\\.42\\.43\\.[0-9]+"));
    EXPECT_EQ(agent_.GetStatus(config), WIFI_STATUS_ENABLED);
}

TEST_F(AdapterAgentClientTest, LeavingClientTopologyDropsTheGatewayAndMultiGatewayRules) {
    root_.ClearCalls();
    EXPECT_EQ(agent_.ClientDisable(AdapterConfig()), -1);
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/sbin/stop dhcp-client IFACE=wlan0", "/sbin/iwconfig wlan0 essid off",
                            "/sbin/ifconfig wlan0 0.0.0.0",
                            "/usr/vorn/sbin/vornnetdtool --del-policy-route-rule -4 "
                            "multi-gateway wlan0",
                            "/usr/vorn/sbin/vornnetdtool --disable-route-table -4 wlan0"));
    EXPECT_TRUE(log_.Contains("Failed to delete GatewayInfo for [wlan0]"));
    EXPECT_TRUE(log_.Contains("Failed to refresh default gateway"));
}

TEST_F(AdapterAgentClientTest, SwitchIntoClientTopologyConnectsWithoutWaitingForItsOwnLock) {
    Adapter::SetDriverSettleTime(std::chrono::milliseconds(0));
    root_.Scenario("wpa_cli", "when -i wlan0 status\nprint wpa_state=COMPLETED\n");
    Adapter::SwitchTopology(WIFI_TOPOLOGY_CLIENT);
    {
        std::unique_ptr<AdapterData> data(AdapterData::Create("wlan0"));
        ASSERT_TRUE(data);
        AdapterConfig config = data->GetConfig();
        config.client_enabled = true;
        config.stations = {Network(WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES, "secret99")};
        ASSERT_EQ(data->SetConfig(config), 0);
        data->Write();
    }
    Adapter::SwitchTopology(WIFI_TOPOLOGY_REPEATER);
    ASSERT_EQ(utils::WriteTopology(WIFI_TOPOLOGY_REPEATER), 0);

    EXPECT_EQ(Adapter::SwitchNetTopology(WIFI_TOPOLOGY_CLIENT), 0);
    ASSERT_NE(Adapter::GetAdapter("wlan0"), nullptr);
    EXPECT_EQ(CallsStartingWith("/usr/sbin/wpa_supplicant -Dwext -i wlan0"), 1);
    // The deferred restart runs once the switch has let go of the lock.
    EXPECT_TRUE(vorn::test::WaitFor([this] {
        return CallsStartingWith("/etc/rc.network reload-network-services") == 2 &&
               !root_.Exists("/tmp/restart_services_pid");
    }));
    Adapter::DeleteAdapterAll();
}

// The RLT radio's station: its file by scheme, refused schemes, the driver reload before the join
// and the way out.
TEST_F(AdapterAgentClientTest, RltStationFileJoinAndLeave) {
    const auto text = [](const StationInfo& station) {
        std::string built;
        return AdapterAgentClientRLT::StationConfigText(station, built) == 0 ? built : "refused";
    };
    EXPECT_EQ(text(Network(WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES, "secret99")),
              "Default\nApCliEnable=1\nApCliSsid=home\nApCliBssid=02:00:00:00:00:01\n"
              "ApCliAuthMode=WPA2PSK\nApCliEncrypType=AES\nApCliWPAPSK=secret99\n");
    EXPECT_THAT(text(Network(WIFI_SECURITY_WEP, WIFI_ENCRYPTION_ERROR, "0a1b2c3d4e")),
                HasSubstr("ApCliAuthMode=SHARED\nApCliEncrypType=WEP\nApCliDefaultKeyID=1\n"
                          "ApCliKey1Type=0\nApCliKey1Str=0a1b2c3d4e\n"));
    EXPECT_THAT(
        text(Network(WIFI_SECURITY_PERSONAL_WPA_MIXED, WIFI_ENCRYPTION_TKIP_AES, "secret99")),
        HasSubstr("ApCliAuthMode=WPA2PSK\nApCliEncrypType=AES\n"));
    EXPECT_THAT(text(Network(WIFI_SECURITY_DISABLED, WIFI_ENCRYPTION_ERROR, "")),
                HasSubstr("ApCliAuthMode=OPEN\nApCliEncrypType=NONE\n"));
    for (const StationInfo& bad :
         {Network(WIFI_SECURITY_ENTERPRISE_WPA2, WIFI_ENCRYPTION_AES, "secret99"),
          Network(WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES, "short"),
          Network(WIFI_SECURITY_WEP, WIFI_ENCRYPTION_ERROR, "0a1b2c3d4z")}) {
        EXPECT_EQ(text(bad), "refused") << bad.password;  // ";" and line breaks: the fuzz target's
    }

    AdapterAgentClientRLT agent("wlan0");
    AdapterConfig config;
    config.client_enabled = true;
    config.stations = {Network(WIFI_SECURITY_PERSONAL_WPA2, WIFI_ENCRYPTION_AES, "secret99")};
    ASSERT_EQ(agent.GetClientConfig(config), 0);
    root_.Scenario("iwpriv", "when wlan0 connStatus\nprint wlan0     connStatus:Disconnected\n");
    EXPECT_EQ(agent.DoConnecting(), -1);
    EXPECT_EQ(CallsStartingWith("/sbin/iwpriv wlan0 connStatus"), 15);
    EXPECT_TRUE(log_.Contains("Time out to connect AP [wlan0]"));
    EXPECT_EQ(CallsStartingWith("/sbin/iwpriv wlan0 set ApCliEnable=0"), 1);

    root_.Scenario("iwpriv",
                   "when wlan0 connStatus\nprint wlan0     connStatus:Connected(AP: home)\n");
    root_.ClearCalls();
    EXPECT_EQ(agent.DoConnecting(), 0);
    const auto calls = root_.Calls();
    ASSERT_GE(calls.size(), 4u);
    EXPECT_EQ(calls[0], "/sbin/rmmod rlt_wifi");
    EXPECT_THAT(calls[1], HasSubstr("/usr/vorn/lib/modules/rlt_wifi.ko"));
    EXPECT_EQ(calls[2], "/sbin/ifconfig wlan0 up");
    EXPECT_EQ(calls[3], "/sbin/iwpriv wlan0 connStatus");
    EXPECT_THAT(root_.ReadFile("/usr/vorn/etc/rlt_wifi/rlt_wifi_sta.conf"),
                HasSubstr("ApCliSsid=home\n"));
    EXPECT_EQ(agent.GetStatus(config), WIFI_STATUS_ENABLED);
    config.stations[0].opmode = WIFI_OPMODE_AD_HOC;
    EXPECT_EQ(agent.AdHocEnable(config), -1);

    root_.ClearCalls();
    EXPECT_EQ(agent.DoDisconnect(), 0);
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/sbin/iwpriv wlan0 set ApCliEnable=0",
                            "/sbin/stop dhcp-client IFACE=wlan0", "/sbin/ifconfig wlan0 down"));
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
