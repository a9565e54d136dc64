#include "network/module/wifiscanner.h"

#include <regex.h>

#include <cerrno>
#include <cstring>
#include <sstream>
#include <utility>
#include <vector>

#include "platform/qlib_net.h"
#include "platform/shell_command.h"
#include "utils/decimal.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

constexpr const char* kInterfacesCommand = "/usr/bin/hostapd_cli interface";
constexpr const char* kHostapdCli = "/usr/bin/hostapd_cli -i ";
// 256 stations a radio, each a MAC line and a few dozen key lines.
constexpr std::size_t kMaxStationLines = 256 * 64;
constexpr const char* kIwDev = "/usr/sbin/iw dev ";
constexpr const char* kStationPattern = "^([0-9a-fA-F][0-9a-fA-F]:){5}([0-9a-fA-F][0-9a-fA-F])$";
constexpr int kLocalNetworkTopology = 1;  // codes above it serve a local network
constexpr int kBestDbm = -35;
constexpr int kWorstDbm = -99;

std::string Word(const std::string& line, std::size_t position) {
    std::istringstream words(line);
    std::string word;
    for (std::size_t i = 0; i <= position; ++i) {
        if (!(words >> word)) {
            return "";
        }
    }
    return word;
}

bool IsStation(const std::string& mac) {
    // regexec would stop at a NUL and pass whatever follows it.
    return mac.find('\0') == std::string::npos &&
           WifiScanner::RegMatch(mac.c_str(), kStationPattern);
}

int LogCommandFailure(const std::string& command) {
    const int error = errno;
    VORN_LOG(LOG_ERR, "Failed to execute cmd [%s], error(%d):(%s)", command.c_str(), error,
             std::strerror(error));
    return -1;
}

}  // namespace

WifiScanner* WifiScanner::Inst() {
    static WifiScanner* const instance = new WifiScanner();
    return instance;
}

Json::Value WifiScanner::GetData() {
    GetHostapdData();
    Json::Value list = GetClientList();
    EraseList();
    return list;
}

int WifiScanner::GetHostapdData() {
    topology = QLIBNetTopologyGet(0);
    if (topology <= kLocalNetworkTopology) {
        return 0;
    }
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(kInterfacesCommand, lines) != 0) {
        return LogCommandFailure(kInterfacesCommand);
    }
    for (const std::string& line : lines) {
        if (line.find("Selected interface") != std::string::npos ||
            line.find("wlan") == std::string::npos) {
            continue;
        }
        if (GetStationByIfName(line) < 0) {
            VORN_LOG(LOG_ERR, "Failed to get connection list for [%s]", line.c_str());
        }
    }
    return 0;
}

int WifiScanner::GetStationByIfName(const std::string& ifname) {
    if (!vornwireless::utils::IsValidInterfaceName(ifname)) {
        VORN_LOG(LOG_ERR, "Refuse a bad interface name [%s]", ifname.c_str());
        return -1;
    }
    const std::string command = kHostapdCli + ifname + " all_sta";
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines, kMaxStationLines) != 0) {
        return LogCommandFailure(command);
    }
    for (const std::string& mac : ParseStations(lines)) {
        AppendClientList(mac, ifname);
    }
    return 0;
}

std::vector<std::string> WifiScanner::ParseStations(const std::vector<std::string>& lines) {
    std::vector<std::string> stations;
    for (const std::string& line : lines) {
        std::string mac = Word(line, 0);
        if (IsStation(mac)) {
            stations.push_back(std::move(mac));
        }
    }
    return stations;
}

int WifiScanner::AppendClientList(const std::string& mac, const std::string& ifname) {
    Json::Value obj(Json::objectValue);
    obj["connection"] = "wifi";
    obj["netif"] = ifname;
    obj["macAddr"] = mac;
    if (GetIwDevInfo(obj) < 0) {
        VORN_LOG(LOG_ERR, "failed to iw dev for wifi data");
    }
    if (!UpdateKeysByMac(mac, obj, true)) {
        VORN_LOG(LOG_ERR, "failed to update key for wifi data");
    }
    return 0;
}

int WifiScanner::GetIwDevInfo(Json::Value& obj) {
    const Json::Value& station = obj;
    if (!station.isObject() || !station["netif"].isString() || !station["macAddr"].isString()) {
        VORN_LOG(LOG_ERR, "cannot find ifname or mac from json data");
        return -1;
    }
    const std::string ifname = station["netif"].asString();
    const std::string mac = station["macAddr"].asString();
    if (!vornwireless::utils::IsValidInterfaceName(ifname) || !IsStation(mac)) {
        VORN_LOG(LOG_ERR, "Refuse to ask iw about [%s] on [%s]", mac.c_str(), ifname.c_str());
        return -1;
    }
    const std::string command = kIwDev + ifname + " station get " + mac;
    std::vector<std::string> lines;
    if (vorn::platform::ReadShellCommandLines(command, lines) != 0) {
        return LogCommandFailure(command);
    }
    ParseIwStation(lines, obj);
    return 0;
}

void WifiScanner::ParseIwStation(const std::vector<std::string>& lines, Json::Value& obj) {
    for (const std::string& line : lines) {
        if (line.find("rx bytes") != std::string::npos) {
            obj["transferRX"] = Word(line, 2);
        } else if (line.find("tx bytes") != std::string::npos) {
            obj["transferTX"] = Word(line, 2);
        } else if (line.find("signal avg") != std::string::npos) {
            int dbm = 0;
            if (vornwireless::utils::ParseDecimal(Word(line, 2), dbm)) {
                obj["signalstrength"] = ConvertDbmToPercent(dbm);
            }
            break;
        }
    }
}

bool WifiScanner::RegMatch(const char* text, const char* pattern) {
    regex_t expression;
    if (text == nullptr || pattern == nullptr ||
        regcomp(&expression, pattern, REG_EXTENDED | REG_NOSUB) != 0) {
        return false;
    }
    const bool matched = regexec(&expression, text, 0, nullptr, 0) == 0;
    regfree(&expression);
    return matched;
}

int WifiScanner::ConvertDbmToPercent(int dbm) {
    if (dbm >= kBestDbm) {
        return 100;
    }
    if (dbm < kWorstDbm) {
        return 0;
    }
    return (100 * dbm + 10000) / 65;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
