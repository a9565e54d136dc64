// An adapter configuration from outside (its JSON form) that GetConfig and the checks accept
// becomes hostapd, RLT and station files whose every line is one line of the expected form: no
// injected line or key, no NUL, and no ";" where the RLT driver would split a value; the adapter's
// saved files read back as the same configuration. A bridge configuration GetConfig accepts reads
// back from its topology file section as written.
#include <json/json.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <map>
#include <memory>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "platform/root_path.h"
#include "require.h"
#include "scratch_world.h"
#include "utils/json_text.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"
#include "wifi/adapter/adapter_agent_client.h"
#include "wifi/adapter/adapter_agent_client_rlt.h"
#include "wifi/adapter/adapter_agent_hostapd_router.h"
#include "wifi/adapter/adapter_agent_rlt.h"
#include "wifi/bridge/local_bridge.h"
#include "wifi/settings/adapter_config_check.h"
#include "wifi/settings/adapter_data.h"
#include "wifi/utils/adapter_config_json.h"
#include "wifi/utils/bridge_config_json.h"

namespace {

using namespace vornwireless::wifi;

constexpr char kRouterTopologyFile[] = "/usr/vorn/etc/wifi/wifi_topology_router";

std::set<std::string> Words(const std::string& text) {
    std::istringstream in(text);
    return {std::istream_iterator<std::string>(in), std::istream_iterator<std::string>()};
}

std::vector<std::string> Lines(const std::string& text) {
    Require(text.find('\0') == std::string::npos && !text.empty() && text.back() == '\n');
    std::vector<std::string> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) {
        Require(line.find('\r') == std::string::npos);
        lines.push_back(line);
    }
    return lines;
}

std::string ReadFile(const std::string& logical) {
    std::ifstream in(vorn::platform::RootPath(logical), std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// key=value lines whose keys are all known and, but for the repeatable ones, each once.
std::map<std::string, std::string> KeyValues(const std::vector<std::string>& lines,
                                             const std::set<std::string>& keys,
                                             const std::set<std::string>& repeatable = {}) {
    std::map<std::string, std::string> values;
    for (const std::string& line : lines) {
        const std::string::size_type equals = line.find('=');
        Require(equals != std::string::npos);
        const std::string key = line.substr(0, equals);
        Require(keys.count(key) == 1);
        Require(values.emplace(key, line.substr(equals + 1)).second || repeatable.count(key) == 1);
    }
    return values;
}

void CheckHostapd(const AdapterConfig& config) {
    AdapterAgentHostapdRouter agent("wlan0");
    if (agent.GenerateHostapdConfig(config) != 0) {
        return;
    }
    const std::set<std::string> keys = Words(
        "interface driver ssid ignore_broadcast_ssid macaddr_acl wpa_psk_file wps_state "
        "ap_setup_locked ctrl_interface config_methods max_num_sta bridge channel wmm_enabled "
        "hw_mode ieee80211n ht_capab require_ht eap_server auth_algs wep_default_key wep_key0 wpa "
        "wpa_key_mgmt wpa_psk wpa_passphrase wpa_pairwise rsn_pairwise ieee8021x "
        "auth_server_addr auth_server_port auth_server_shared_secret deny_mac_file "
        "accept_mac_file bss bssid ap_isolate enable");
    for (const char* file : {"-host.conf", "-guest.conf", ".info", "-guest.info"}) {
        KeyValues(Lines(ReadFile(std::string("/etc/hostapd/hostapd-wlan0") + file)), keys,
                  {"macaddr_acl"});
    }
}

void CheckRLT(const AdapterConfig& config) {
    AdapterAgentRLTRouter agent("wlan0");
    const int result = agent.GenerateRLTConfig(config);
    Require(result == 0 || CheckRLTConfig(config) != 0 || CheckAccessPointConfig(config) != 0);
    if (result != 0) {
        return;
    }
    std::vector<std::string> lines = Lines(ReadFile("/usr/vorn/etc/rlt_wifi/rlt_wifi.conf"));
    Require(lines.front() == "Default");
    lines.erase(lines.begin());
    // One value per network: at most "main;guest;".
    const std::set<std::string> lists =
        Words("HideSSID AuthMode EncrypType DefaultKeyID Key1 WPAPSK IEEE8021X NoForwarding");
    std::set<std::string> keys = Words(
        "CountryRegion CountryRegionABand CountryCode BssidNum SSID1 SSID2 WirelessMode Channel "
        "MaxStaNum WmmCapable HT_BW VHT_BW TxPower RADIUS_Server RADIUS_Port RADIUS_Key "
        "own_ip_addr EAPifname PreAuthifname");
    keys.insert(lists.begin(), lists.end());
    for (const auto& pair : KeyValues(lines, keys)) {
        const auto separators = std::count(pair.second.begin(), pair.second.end(), ';');
        Require(lists.count(pair.first) == 1 ? separators <= 2 : separators == 0);
    }
}

void CheckStations(const AdapterConfig& config) {
    for (const auto& station : config.stations) {
        std::string text;
        if (AdapterAgentClient::WpaSupplicantConfigText(station, text) == 0) {
            std::vector<std::string> lines = Lines(text);
            Require(lines.size() >= 4 && lines[1] == "network={" && lines.back() == "}");
            KeyValues({lines.front()}, {"ctrl_interface"});
            std::vector<std::string> block(lines.begin() + 2, lines.end() - 1);
            for (std::string& line : block) {
                Require(line.size() > 1 && line[0] == '\t');
                line.erase(0, 1);
            }
            KeyValues(block, Words("ssid bssid scan_ssid mode key_mgmt wep_key0 auth_alg pairwise "
                                   "psk wep_tx_keyidx eap identity password"));
        }
        if (AdapterAgentClientRLT::StationConfigText(station, text) == 0) {
            std::vector<std::string> lines = Lines(text);
            Require(lines.front() == "Default");
            lines.erase(lines.begin());
            for (const auto& pair :
                 KeyValues(lines, Words("ApCliEnable ApCliSsid ApCliBssid ApCliAuthMode "
                                        "ApCliEncrypType ApCliDefaultKeyID ApCliKey1Type "
                                        "ApCliKey1Str ApCliWPAPSK"))) {
                Require(pair.second.find(';') == std::string::npos);
            }
        }
    }
}

void CheckSaved(AdapterConfig config) {
    using Data = std::unique_ptr<AdapterData, int (*)(AdapterData*)>;
    const Data data(AdapterData::Create("wlan0"), AdapterData::Delete);
    Require(data != nullptr);
    // What the adapter itself tells, not its files.
    config.bssid = data->GetConfig().bssid;
    config.driver = data->GetConfig().driver;
    data->SetConfig(config);
    data->Write();
    const Data back(AdapterData::Create("wlan0"), AdapterData::Delete);
    Require(back != nullptr && back->GetConfig() == config);
}

void CheckBridge(const Json::Value& json) {
    BridgeConfig config;
    if (utils::GetConfig(json, config) != 0) {
        return;
    }
    Require(LocalBridge("lbr0").SetTopologyFile(config) == 0);
    BridgeConfig back;
    Require(utils::GetConfig(std::string(kRouterTopologyFile), "lbr0", back) == 0 &&
            back.ToFields() == config.ToFields());
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    // The folders above those the agents make.
    EnterScratchWorld({"/etc", "/usr/vorn/etc/wifi", "/sys/class/net/wlan0"});
    std::ofstream(vorn::platform::RootPath("/sys/class/net/wlan0/address"))
        << "02:76:6f:72:6e:02\n";
    Adapter::SwitchTopology(WIFI_TOPOLOGY_ROUTER);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Json::Value json;
    if (!vornwireless::utils::ParseJson(std::string(reinterpret_cast<const char*>(data), size),
                                        json, 1 << 16)) {
        return 0;
    }
    CheckBridge(json);
    AdapterConfig config;
    if (vornwireless::wifi::utils::GetConfig(json, config) != 0) {
        return 0;
    }
    config.name = "wlan0";
    CheckHostapd(config);
    CheckRLT(config);
    CheckStations(config);
    CheckSaved(config);
    return 0;
}
