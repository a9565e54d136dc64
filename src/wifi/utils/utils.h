#ifndef VORN_WIFI_UTILS_UTILS_H
#define VORN_WIFI_UTILS_UTILS_H

#include <string>

#include "wifi/settings/enum.h"

// The small wifi utilities: interface facts, the appliance model, the password cipher and the
// stored topology.
namespace vornwireless {
namespace wifi {
namespace utils {

// The MAC address in "/sys/class/net/IF/address", or "" (logged) when it cannot be read.
std::string GetBssid(const std::string& ifname);

// The appliance model: key "model" of "/etc.defaults/vorninfo.conf" ("" when absent). The Kite
// line is "kite-a" and "kite-b"; its built-in radio is the interface whose MAC address is the
// key "builtin_wlan_mac" of the same file.
std::string GetModelName();
bool IsKiteModel();
bool IsKiteAModel();
bool IsKiteBModel();
bool IsKiteBuiltInWlan(const std::string& ifname);
bool IsKiteABuiltInWlan(const std::string& ifname);
bool IsKiteBBuiltInWlan(const std::string& ifname);
// The built-in radio's MAC address on the kite-b model, else "".
std::string GetKiteBWlanMacAddress();

// What the radio reports as its 802.11 modes (the seventh blank-separated word of iwconfig's
// "IEEE 802.11" line, e.g. "802.11bgn"). 0, or -1 when the command cannot be started.
int GetSupportedMode(const std::string& ifname, std::string& modes);

// Only "wlan0" of a Kite model carries a guest network.
bool IsGuestNetworkSupport(const std::string& ifname);

// N of a name "wlanN" / "gbrN", or -1 for any other name.
int GetWirelessIndex(const std::string& name);
int GetGuestBridgeIndex(const std::string& name);

// The platform's string cipher. 0 or -1; a cipher text that does not decipher (altered, foreign,
// made under another key) fails and leaves plain empty. An empty stored text is no password.
int EncryptPlainText(const std::string& plain, std::string& cipher);
int DecryptCipherText(const std::string& cipher, std::string& plain);

// Key "net_topology" of "/etc/vorninfo.conf". A missing key is stored and read as "client"; a
// read error or an unknown word gives WIFI_TOPOLOGY_ERROR.
WIFI_TOPOLOGY ReadTopology();
int WriteTopology(WIFI_TOPOLOGY topology);

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless

#endif
