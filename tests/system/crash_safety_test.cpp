// Every kind of file the daemons replace, rewritten in a loop by a child process through the
// library's own writer and killed at random moments: each file is then one whole version, never
// torn, empty or missing.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <functional>
#include <memory>
#include <random>
#include <thread>

#include "network/dhcp/dhcpd_config.h"
#include "network/module/clientlist.h"
#include "network/module/route_module.h"
#include "platform/qlibc_file.h"
#include "support/sim_root.h"
#include "wifi/adapter/adapter.h"
#include "wifi/bridge/local_bridge.h"
#include "wifi/settings/adapter_data.h"
#include "wifi/utils/utils.h"

namespace vorn {
namespace test {
namespace {

namespace fs = std::filesystem;
namespace dhcp = vornnetwork::network::dhcp;
namespace module = vornnetwork::network::module;
using namespace vornwireless::wifi;

constexpr int kKillsPerKind = 1000;
constexpr const char* kDeviceList =
    "/var/packages/Linkyard/target/data//connectionlist_upnpscanner.json";

// The files one write replaces, and that write in version A (false) or B (true).
struct Kind {
    const char* name;
    std::vector<std::string> files;
    std::function<void(bool)> write;
};

std::unique_ptr<QLIBSZHASH, void (*)(QLIBSZHASH*)> Pair(const char* key, const char* value) {
    std::unique_ptr<QLIBSZHASH, void (*)(QLIBSZHASH*)> hash(QLIBCSzHashAlloc(1), QLIBCSzHashFree);
    QLIBCSzHashSetValue(hash.get(), key, value);
    return hash;
}

// What a file holds, "" when missing; secrets are encrypted with a fresh nonce at every write.
std::string Content(const SimRoot& root, const std::string& file) {
    std::string text = root.ReadFile(file);
    for (auto at = text.find("vc1:"); at != std::string::npos; at = text.find("vc1:", at + 4)) {
        const auto end = text.find_first_not_of("0123456789abcdef", at + 4);
        text.erase(at + 4, (end == std::string::npos ? text.size() : end) - at - 4);
    }
    return text;
}

// Nothing in the daemons removes the temporary file ("<file>.tmp.XXXXXX") a killed writer leaves,
// and nothing reads it; removed here so that the root stays small. Returns how many there were.
int RemoveTemporaries(const SimRoot& root, const Kind& kind) {
    int removed = 0;
    for (const auto& file : kind.files) {
        const fs::path path = root.Path(file);
        const std::string prefix = path.filename().string() + ".tmp.";
        for (const auto& entry : fs::directory_iterator(path.parent_path())) {
            removed += entry.path().filename().string().rfind(prefix, 0) == 0 && fs::remove(entry);
        }
    }
    return removed;
}

// After each kill every file holds its A or its B; both must turn up, or no write ever finished.
void ExpectWholeAfterKills(const SimRoot& root, const Kind& kind) {
    std::vector<std::string> versions[2];
    for (bool b : {false, true}) {
        kind.write(b);
        for (const auto& file : kind.files) {
            versions[b].push_back(Content(root, file));
            ASSERT_TRUE(b == false || versions[0].back().size() != versions[1].back().size())
                << kind.name << ": " << file << " needs versions of different lengths";
        }
    }
    std::mt19937 random(kKillsPerKind);
    std::uniform_int_distribution<int> delay(0, 2000);
    int seen[2] = {0, 0};
    int temporaries = 0;
    for (int kill = 0; kill < kKillsPerKind; ++kill) {
        int started[2];
        ASSERT_EQ(pipe(started), 0);
        const pid_t child = fork();
        ASSERT_GE(child, 0);
        if (child == 0) {
            if (write(started[1], "w", 1) != 1) {
                _exit(1);
            }
            for (bool b = kill % 2 == 0;; b = !b) {
                kind.write(b);
            }
        }
        char byte = 0;
        close(started[1]);
        ASSERT_EQ(read(started[0], &byte, 1), 1);
        close(started[0]);
        std::this_thread::sleep_for(std::chrono::microseconds(delay(random)));
        ::kill(child, SIGKILL);
        waitpid(child, nullptr, 0);
        for (size_t i = 0; i < kind.files.size(); ++i) {
            const std::string now = Content(root, kind.files[i]);
            ASSERT_TRUE(now == versions[0][i] || now == versions[1][i])
                << kind.name << ": " << kind.files[i] << " after kill " << kill << " holds "
                << now.size() << " bytes";
            seen[now == versions[1][i]] += i == 0;
        }
        temporaries += RemoveTemporaries(root, kind);
    }
    EXPECT_TRUE(seen[0] > 0 && seen[1] > 0) << kind.name;
    std::printf("%s: %d kills, A %d, B %d, temporary files %d\n", kind.name, kKillsPerKind, seen[0],
                seen[1], temporaries);
}

TEST(CrashSafetyTest, KilledWritersLeaveWholeFiles) {
    LogCapture log;
    // A kill is a process crash, not a power cut: on tmpfs fsync costs nothing, so the kills land
    // anywhere in a write rather than mostly inside fsync, and the run stays short.
    SavedVariable savedTemp("TMPDIR");
    setenv("TMPDIR", "/dev/shm", 1);
    SimRoot root;
    ASSERT_EQ(QLIBCFileSetKeyValue("/etc/vorninfo.conf", "dns_mode", "manual"), 0);
    root.WriteFile(kDeviceList, "[]");
    Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER);
    std::unique_ptr<AdapterData, int (*)(AdapterData*)> adapter(AdapterData::Create("wlan0"),
                                                                AdapterData::Delete);
    ASSERT_TRUE(adapter);
    AdapterConfig adapters[2] = {adapter->GetConfig(), adapter->GetConfig()};
    LocalBridge bridge("lbr0");
    BridgeConfig bridges[2];
    dhcp::DHCPD_CONF subnets[2] = {};
    module::RouteModule routes[2];
    module::ClientList devices[2];
    for (bool b : {false, true}) {
        adapters[b].ssid = b ? "a longer network name" : "net";
        adapters[b].mac_filter_policy =
            b ? WIFI_MAC_FILTER_POLICY_ALLOW : WIFI_MAC_FILTER_POLICY_DENY;
        adapters[b].mac_filter_rules = {{true, vornwireless::utils::MacAddress("02:00:00:00:00:09"),
                                         b ? "living room tv" : "tv"}};
        adapters[b].client_enabled = b;
        bridges[b].apIpAddress = vornwireless::utils::IPAddress(b ? "10.100.100.1" : "10.0.0.1");
        bridges[b].slaveList =
            b ? std::vector<std::string>{"wlan0", "wlan1"} : std::vector<std::string>{"wlan0"};
        subnets[b].type = dhcp::SERVICE_TYPE_IPV4;
        std::snprintf(subnets[b].ifname, sizeof(subnets[b].ifname), "eth0");
        std::snprintf(subnets[b].domain, sizeof(subnets[b].domain), b ? "lan.example" : "lan");
        root.WriteFile("/etc/iproute2/config/gateway_v4_priority",
                       b ? "[0]\nifname=eth1\ndns=10.0.0.53\n[1]\nifname=eth0\n"
                         : "[0]\nifname=eth0\ndns=192.168.1.1\n");
        ASSERT_EQ(routes[b].ReadGatewayListFromFile(module::GTYPE_V4), 0);
        devices[b].UpdateKeysByMac("02:00:00:00:00:01", Parse(R"({"ipAddr": "10.0.0.9"})"), true);
    }
    devices[1].UpdateKeysByMac("02:00:00:00:00:02", Parse(R"({"ipAddr": "10.0.0.8"})"), true);
    const Kind kinds[] = {
        {"section files",
         {"/etc/iproute2/config/sections"},
         [](bool b) {
             QLIBCFileAddSection("/etc/iproute2/config/sections", "lan",
                                 Pair("ip", b ? "10.100.100.1" : "10.0.0.1").get(), "\t%s=%s\n");
         }},
        {"key files",
         {"/etc/sysconfig/network-scripts/ifcfg-lbr0"},
         [](bool b) {
             QLIBCFileSetKeyValue("/etc/sysconfig/network-scripts/ifcfg-lbr0", "IPADDR",
                                  b ? "10.100.100.1" : "10.0.0.1");
         }},
        {"adapter files",
         {"/usr/vorn/etc/wifi/wifi_ap_02:76:6f:72:6e:02",
          "/usr/vorn/etc/wifi/wifi_client_02:76:6f:72:6e:02", "/etc/hostapd/mac_filter/mf.info",
          "/etc/hostapd/mac_filter/mf.conf"},
         [&](bool b) {
             adapter->SetConfig(adapters[b]);
             adapter->Write();
         }},
        {"topology files",
         {"/usr/vorn/etc/wifi/wifi_topology_router", "/etc/vorninfo.conf"},
         [&](bool b) {
             bridge.SetTopologyFile(bridges[b]);
             utils::WriteTopology(b ? WIFI_TOPOLOGY_REPEATER : WIFI_TOPOLOGY_ROUTER);
         }},
        {"DHCP files",
         {"/etc/dhcpd/dhcpd-eth0-eth00.conf", "/etc/dhcpd/dhcpd-eth0-eth00.info"},
         [&](bool b) {
             dhcp::DhcpdConfig::saveConf({subnets[b]}, "eth0", dhcp::SERVICE_TYPE_IPV4);
             dhcp::DhcpdConfig::saveInfo(Pair("enable", b ? "yes" : "no").get(), "eth0",
                                         dhcp::SERVICE_TYPE_IPV4);
         }},
        {"priority lists",
         {"/etc/iproute2/config/gateway_v4_priority", "/etc/iproute2/config/resolv4.conf"},
         [&](bool b) { routes[b].WriteGatewayListToFile(module::GTYPE_V4); }},
        {"device list", {kDeviceList}, [&](bool b) { devices[b].WriteToFile(kDeviceList); }},
    };
    for (const Kind& kind : kinds) {
        ExpectWholeAfterKills(root, kind);
    }
}

}  // namespace
}  // namespace test
}  // namespace vorn
