#ifndef VORN_NETWORK_MODULE_WIFISCANNER_H
#define VORN_NETWORK_MODULE_WIFISCANNER_H

#include <string>
#include <vector>

#include "network/module/clientlist.h"

namespace vornnetwork {
namespace network {
namespace module {

// Stations associated with the local access points, from hostapd, with traffic counters and
// signal strength from iw. Scans run on the caller's thread.
class WifiScanner : public ClientList {
  public:
    static WifiScanner* Inst();

    // Scans, returns the list and empties it.
    Json::Value GetData();
    int Start() { return 0; }
    int Stop() { return 0; }

    int GetHostapdData();
    int GetStationByIfName(const std::string& ifname);
    int AppendClientList(const std::string& mac, const std::string& ifname);
    // Adds "transferRX", "transferTX" and "signalstrength" to obj, which names the station by
    // "netif" and "macAddr".
    int GetIwDevInfo(Json::Value& obj);
    // The stations of "hostapd_cli all_sta": the first words that match the station pattern.
    static std::vector<std::string> ParseStations(const std::vector<std::string>& lines);
    // The counters and signal of "iw dev IF station get MAC" into obj, as GetIwDevInfo adds them.
    static void ParseIwStation(const std::vector<std::string>& lines, Json::Value& obj);
    // Whether text matches the extended regular expression pattern.
    static bool RegMatch(const char* text, const char* pattern);
    static int ConvertDbmToPercent(int dbm);

  private:
    WifiScanner() = default;

    int topology = 0;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
