#include "wifi/adapter/adapter.h"

#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>

#include "support/sim_root.h"
#include "wifi/adapter/adapter_agent_ap.h"
#include "wifi/bridge/bridge_base.h"
#include "wifi/utils/bridge_config_json.h"

namespace vornwireless {
namespace wifi {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using Kind = AdapterAgent::Kind;

// Records what the adapter layer asks of an access point.
class RecordingAgent : public AdapterAgentAP {
  public:
    explicit RecordingAgent(std::vector<std::string>& calls)
        : AdapterAgentAP("wlan0"), calls_(calls) {}

    int Enable(const AdapterConfig& c) override { return Record("Enable", c.enabled); }
    int Recover(const AdapterConfig& c) override { return Record("Recover", c.enabled); }
    int Disable(const AdapterConfig& c) override { return Record("Disable", c.enabled); }
    WIFI_STATUS GetStatus(const AdapterConfig&) const override { return status; }
    int ScanNetworks(const AdapterConfig&, std::vector<AdapterConfig::StationInfo>&) override {
        return 0;
    }
    int LoadStationConnData(std::vector<utils::ConnectionInfo>&) override { return 0; }
    int EnableWPSWithPBC() override { return 0; }
    int EnableWPSWithPinCode(const std::string&) override { return 0; }
    int EnableAP(const AdapterConfig& c) override { return Record("EnableAP", c.enabled); }
    int DisableAP(const AdapterConfig& c) override { return Record("DisableAP", c.enabled); }
    int SetTXPower(const AdapterConfig& c) override { return Record("SetTXPower", c.enabled); }
    int EnableRuleGuest(const AdapterConfig& c) override {
        return Record("EnableRuleGuest", c.enabled);
    }
    int DisableRuleGuest(const AdapterConfig& c) override {
        return Record("DisableRuleGuest", c.enabled);
    }
    int SetSchedule(const AdapterConfig& c) override { return Record("SetSchedule", c.enabled); }

    WIFI_STATUS status = WIFI_STATUS_DISABLED;

  private:
    int Record(const char* step, bool enabled) {
        calls_.push_back(std::string(step) + (enabled ? "(on)" : "(off)"));
        return 0;
    }
    std::vector<std::string>& calls_;
};

class AdapterTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER);
        Adapter::SetDriverSettleTime(std::chrono::milliseconds(0));
        root_.Scenario("iwconfig", "when wlan0\nprint wlan0     IEEE 802.11bgn  ESSID:off/any\n");
    }
    void TearDown() override { Adapter::DeleteAdapterAll(); }

    // wlan0 with its real settings and capability, driven by a recording agent.
    Adapter& AddRecorded() {
        auto agent = std::make_unique<RecordingAgent>(calls_);
        agent_ = agent.get();
        Adapter::GetList().push_back(std::make_unique<Adapter>(
            std::move(agent), std::unique_ptr<AdapterData>(AdapterData::Create("wlan0")),
            std::unique_ptr<AdapterCapability>(AdapterCapability::Create("wlan0"))));
        EXPECT_FALSE(Adapter::GetList().back()->HasNullMember());
        return *Adapter::GetList().back();
    }

    static std::tm At(int weekday, int hour) {
        std::tm time{};
        time.tm_wday = weekday;
        time.tm_hour = hour;
        time.tm_min = 30;
        return time;
    }

    std::vector<std::string> calls_;
    RecordingAgent* agent_ = nullptr;
};

TEST_F(AdapterTest, AgentChoiceByDriverModelAndTopology) {
    AdapterConfig config;
    config.name = "wlan0";
    EXPECT_EQ(AdapterAgent::Choose(config, WIFI_TOPOLOGY_ROUTER), Kind::kNone);
    EXPECT_TRUE(log_.Contains("Not supported driver(0)"));
    config.driver = WIFI_DRIVER_NL80211;
    const std::vector<std::pair<WIFI_TOPOLOGY, std::pair<Kind, Kind>>> table = {
        {WIFI_TOPOLOGY_ROUTER, {Kind::kHostapdRouter, Kind::kRLTRouter}},
        {WIFI_TOPOLOGY_BRIDGE, {Kind::kHostapdBridge, Kind::kRLTBridge}},
        {WIFI_TOPOLOGY_CLIENT, {Kind::kClient, Kind::kClientRLT}},
        {WIFI_TOPOLOGY_REPEATER, {Kind::kNone, Kind::kNone}}};
    for (const auto& row : table) {
        EXPECT_EQ(AdapterAgent::Choose(config, row.first), row.second.first) << row.first;
    }
    EXPECT_TRUE(log_.Contains("Failed to create hostapd agent"));
    // The Kite B's built-in radio is the RLT radio; another radio of it is not.
    root_.WriteFile("/etc.defaults/vorninfo.conf",
                    "model=\"kite-b\"\nbuiltin_wlan_mac=\"02:76:6f:72:6e:02\"\n");
    for (const auto& row : table) {
        EXPECT_EQ(AdapterAgent::Choose(config, row.first), row.second.second) << row.first;
    }
    EXPECT_TRUE(log_.Contains("Failed to create rlt agent"));
    config.name = "wlan1";
    EXPECT_EQ(AdapterAgent::Choose(config, WIFI_TOPOLOGY_BRIDGE), Kind::kHostapdBridge);

    EXPECT_EQ(Adapter::AddAdapter("wlan0"), 0);  // its RLT agent exists
    EXPECT_EQ(Adapter::RefreshAdapterList(), 0);
    EXPECT_THAT(root_.ReadFile("/etc/vorninfo.conf"), HasSubstr("support_net_topology=\"yes\""));
}

TEST_F(AdapterTest, ApplyReloadsByFlagsAndTheScheduleSwitchesByTheHour) {
    EXPECT_EQ(Adapter::EnableAll(), -1);
    Adapter& adapter = AddRecorded();
    // A fresh adapter reloads everything once.
    AdapterConfig config = adapter.GetConfig();
    ASSERT_EQ(adapter.Apply(config), 0);
    EXPECT_THAT(calls_,
                ElementsAre("DisableAP(on)", "EnableAP(on)", "SetTXPower(on)",
                            "DisableRuleGuest(on)", "EnableRuleGuest(on)", "SetSchedule(on)"));
    calls_.clear();
    config.max_num_client = 100000;
    EXPECT_EQ(adapter.Apply(config), -1);
    EXPECT_TRUE(log_.Contains("Bad config"));
    EXPECT_THAT(calls_, IsEmpty());

    // On from 00:00 to 01:00 on Sunday only; the Saturday night hour is the last flag.
    config = adapter.GetConfig();
    config.schedule_enabled = true;
    config.schedule.fill(false);
    config.schedule[0] = true;
    ASSERT_EQ(adapter.Apply(config), 0);
    EXPECT_THAT(calls_, ElementsAre("SetSchedule(on)"));
    calls_.clear();
    EXPECT_EQ(ScheduleIndex(At(6, 23)), 167u);
    EXPECT_EQ(adapter.ExecSchedule(At(0, 0)), 0);
    EXPECT_THAT(calls_, IsEmpty());
    EXPECT_EQ(adapter.ExecSchedule(At(1, 1)), 0);
    EXPECT_THAT(calls_, ElementsAre("DisableAP(off)", "EnableAP(off)", "DisableRuleGuest(off)",
                                    "EnableRuleGuest(off)"));
    EXPECT_FALSE(adapter.GetConfig().enabled);

    // The radio button turns all on without storing it; the stored settings stay off.
    calls_.clear();
    config = adapter.GetConfig();
    config.is_pci_interface = true;
    ASSERT_EQ(adapter.Apply(config), 0);
    EXPECT_EQ(Adapter::SwitchOnOff(), 0);
    agent_->status = WIFI_STATUS_ENABLING;
    EXPECT_EQ(Adapter::SwitchOnOff(), 0);
    EXPECT_THAT(calls_, ElementsAre("Enable(on)", "Disable(off)"));
    EXPECT_FALSE(adapter.GetConfig().enabled);
    // A bridge is on while one of its slaves' radios is.
    ASSERT_EQ(BridgeBase::SwitchTopology(WIFI_TOPOLOGY_ROUTER), 0);
    EXPECT_EQ(utils::GetJsonValue(BridgeBase::GetBridge("lbr0"))["status"], "disabled");
    agent_->status = WIFI_STATUS_ENABLED;
    EXPECT_EQ(utils::GetJsonValue(BridgeBase::GetBridge("lbr0"))["status"], "enabled");
    BridgeBase::ClearBridgeList();
    Adapter::SwitchTopology(WIFI_TOPOLOGY_CLIENT);
    EXPECT_EQ(adapter.ExecSchedule(At(0, 0)), -1);
}

TEST_F(AdapterTest, GuestRulesAndScheduleEntry) {
    Adapter& adapter = AddRecorded();
    AdapterConfig config = adapter.GetConfig();
    config.enabled = config.guest_support = config.guest_enabled = true;
    config.schedule_enabled = true;
    root_.WriteFile("/usr/vorn/bin/vornwireless", "#!/bin/sh\n");
    root_.WriteFile("/etc/victim", "keep\n");
    ASSERT_EQ(
        symlink(root_.Path("/etc/victim").c_str(), root_.Path("/tmp/vornwireless.wlan0").c_str()),
        0);
    root_.ClearCalls();
    AdapterAgentAP& agent = *agent_;
    EXPECT_EQ(agent.AdapterAgentAP::DisableRuleGuest(config), 0);
    EXPECT_EQ(agent.AdapterAgentAP::EnableRuleGuest(config), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre("/usr/vorn/etc/iptables_guest_net.sh del all wlan0",
                                           "/usr/vorn/etc/iptables_guest_net.sh del mod",
                                           "/usr/vorn/etc/iptables_guest_net.sh ins mod",
                                           "/usr/vorn/etc/iptables_guest_net.sh ins all wlan0"));
    ASSERT_EQ(agent.AdapterAgentAP::SetSchedule(config), 0);
    EXPECT_EQ(root_.ReadFile("/var/spool/cron/crontabs/root"),
              "0 0-23 * * * /tmp/vornwireless.wlan0 --exec-schedule wlan0\n");
    // The planted link was replaced, not written through.
    EXPECT_EQ(root_.ReadFile("/etc/victim"), "keep\n");
    struct stat copy;
    ASSERT_EQ(lstat(root_.Path("/tmp/vornwireless.wlan0").c_str(), &copy), 0);
    EXPECT_TRUE(S_ISREG(copy.st_mode));
    EXPECT_EQ(copy.st_mode & 0777, 0755u);

    config.name = "wlan0;reboot";
    EXPECT_EQ(agent.AdapterAgentAP::SetSchedule(config), -1);
    config.name = "wlan0";
    config.schedule_enabled = false;
    EXPECT_EQ(agent.AdapterAgentAP::SetSchedule(config), 0);
    EXPECT_EQ(root_.ReadFile("/var/spool/cron/crontabs/root"), "");
    EXPECT_FALSE(root_.Exists("/tmp/vornwireless.wlan0"));
}

TEST_F(AdapterTest, TopologySwitchRunsInOrderAndAlwaysResumesTheEventDaemon) {
    // A stand-in for the event daemon, which must never be left stopped.
    const pid_t daemon = fork();
    ASSERT_GE(daemon, 0);
    if (daemon == 0) {
        pause();
        _exit(0);
    }
    root_.WriteFile("/var/run/evmond.pid", std::to_string(daemon) + "\n");
    const auto running = [daemon] { return vorn::test::ProcessState(daemon) != 'T'; };
    ASSERT_EQ(utils::WriteTopology(WIFI_TOPOLOGY_CLIENT), 0);
    Adapter::SwitchTopology(WIFI_TOPOLOGY_CLIENT);
    root_.ClearCalls();

    EXPECT_EQ(Adapter::SwitchNetTopology(WIFI_TOPOLOGY_REPEATER), 0);
    EXPECT_THAT(root_.Calls(),
                ElementsAre("/lib/udev/script/usb-wifi-util.sh unload-driver client",
                            "/lib/udev/script/usb-wifi-util.sh load-driver repeater",
                            "/sbin/iwconfig wlan0", "/usr/vorn/etc/rc.d/S98upnpd.sh restart",
                            "/etc/rc.network reload-network-services",
                            "/etc/rc.network firewall-reload", "/etc/rc.network tc-reload",
                            "/usr/vorn/sbin/vornnetdtool --refresh-gateway all"));
    EXPECT_EQ(Adapter::GetTopology(), WIFI_TOPOLOGY_REPEATER);
    EXPECT_EQ(utils::ReadTopology(), WIFI_TOPOLOGY_REPEATER);
    EXPECT_TRUE(running());
    EXPECT_FALSE(root_.Exists("/tmp/topology.lock"));

    // A driver that does not load ends the switch, and still the daemon runs on.
    root_.Scenario("usb-wifi-util.sh", "when load-driver*\nexit 1\n");
    root_.ClearCalls();
    EXPECT_EQ(Adapter::SwitchNetTopology(WIFI_TOPOLOGY_CLIENT), -1);
    EXPECT_TRUE(log_.Contains("Failed on switch kernel module"));
    EXPECT_EQ(root_.Calls().size(), 2u);
    EXPECT_EQ(Adapter::GetTopology(), WIFI_TOPOLOGY_REPEATER);
    EXPECT_TRUE(running());
    EXPECT_FALSE(root_.Exists("/tmp/topology.lock"));
    kill(daemon, SIGKILL);
    waitpid(daemon, nullptr, 0);
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
