#include "wifi/utils/station_utils.h"

#include <strings.h>

#include <algorithm>
#include <map>
#include <string>

#include "platform/qlibc_container.h"
#include "platform/qlibc_file.h"
#include "platform/shell_command.h"
#include "platform/text_file.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "wifi/utils/adapter_config_json.h"

namespace vornwireless {
namespace wifi {
namespace utils {
namespace {

constexpr int kMaxInterfaces = 128;
constexpr std::size_t kMaxStatusLines = 64;
constexpr std::size_t kStatusLineBytes = 512;

}  // namespace

bool ReadSupplicantStatus(const std::string& ifname, std::map<std::string, std::string>& status) {
    if (!vornwireless::utils::CheckInterfaceName(ifname)) {
        return false;
    }
    const std::string command = "/usr/sbin/wpa_cli -i " + ifname + " status";
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines, kMaxStatusLines, kStatusLineBytes) !=
        0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", command.c_str());
        return false;
    }
    ParseSupplicantStatus(lines, status);
    return true;
}

void ParseSupplicantStatus(const std::vector<std::string>& lines,
                           std::map<std::string, std::string>& status) {
    for (const std::string& line : lines) {
        std::string key, value;
        if (vorn::platform::ParseKeyLine(line, "=", false, key, value)) {
            status[key] = value;
        }
    }
}

int GetAdapterNum() {
    QLIBSZLIST* list = nullptr;
    const int count = QLIBCFileEnumDir("/sys/class/net", "wlan", kMaxInterfaces, &list);
    QLIBCSzListFree(list);
    return count > 0 ? count : 0;
}

Json::Value StationInfoToJson(const AdapterConfig::StationInfo& station) {
    AdapterConfig config;
    config.stations.push_back(station);
    Json::Value json = GetJsonValue(config)["stations"][0];
    json["signal"] = station.signal;
    return json;
}

int ParseConnectionList(const std::vector<ConnectionInfo>& connections, Json::Value& list) {
    list = Json::Value(Json::arrayValue);
    for (const ConnectionInfo& connection : connections) {
        Json::Value item(Json::objectValue);
        item["macAddr"] = connection.mac.ToString();
        item["ipAddr"] = connection.ip.ToString();
        item["hostname"] = connection.hostname;
        item["connected_time"] = connection.connected_time;
        list.append(item);
    }
    return 0;
}

int GetConnectedAPInfo(const AdapterConfig& config, Json::Value& info) {
    std::map<std::string, std::string> status;
    if (!ReadSupplicantStatus(config.name, status) || status["wpa_state"] != "COMPLETED") {
        return -1;
    }
    const std::string& bssid = status["bssid"];
    const auto joined =
        std::find_if(config.stations.begin(), config.stations.end(),
                     [&](const AdapterConfig::StationInfo& station) {
                         return strcasecmp(station.bssid.ToCString(), bssid.c_str()) == 0 ||
                                station.essid == status["ssid"];
                     });
    AdapterConfig::StationInfo station;
    if (joined != config.stations.end()) {
        station = *joined;
    } else {
        station.essid = status["ssid"];
    }
    station.password.clear();
    station.signal = GetSignalStrength(config.name);
    info = StationInfoToJson(station);
    info["bssid"] = bssid;
    info["ip"] = status["ip_address"];
    return 0;
}

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless
