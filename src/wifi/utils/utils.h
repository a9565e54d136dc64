#ifndef VORN_WIFI_UTILS_UTILS_H
#define VORN_WIFI_UTILS_UTILS_H

#include <string>
#include <vector>

#include "utils/ip_address.h"
#include "utils/mac_address.h"
#include "wifi/settings/enum.h"

// The small wifi utilities: interface facts, the appliance model, the password cipher and the
// stored topology.
namespace vornwireless {
namespace wifi {
namespace utils {

// A station connected to one of the appliance's access points.
struct ConnectionInfo {
    vornwireless::utils::MacAddress mac;
    vornwireless::utils::IPAddress ip;
    std::string hostname;
    int connected_time = 0;  // seconds
};

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
// The letters of the 802.11 modes a radio's "iw phy PHY info" lines show: "bg" for band 1 (2.4
// GHz), "a" for band 2 (5 GHz), "n" when HT20 rates are listed.
std::string ParseBandLetters(const std::vector<std::string>& lines);
// The wiphy of a mac80211 radio ("phy0"); "" for any other interface.
std::string GetPhyName(const std::string& ifname);

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
// The topology's word while the wifi daemon "vornwifid" runs, else "none". 0, or -1 when the
// stored topology cannot be read.
int GetTopologyString(std::string& out);
// Key "support_net_topology" ("yes"/"no") and "has_wifi_dongle" of "/etc/vorninfo.conf".
int SetSupportNetTopology(bool support);
int SetHasWifiDongle(bool has);
bool IsSupportTopology();
bool HasWifiDongle();

// "br0" for the bridge topology, "lbr0" for router, "" for the others.
std::string GetBridgeName(WIFI_TOPOLOGY topology);
// The first member interface of the bridge as "brctl show" lists it (the bridge's whole name
// matched), "" when it has none. 0, or -1 for a bad name or a command that cannot run.
int GetFirstExistentSlaveByBridge(const std::string& bridge, std::string& out);
// Whether the section file holds "[section]" (any case). False, logged, for a missing file or a
// section name that is not a plain word.
bool IsSectionExist(const std::string& file, const std::string& section);
// The link quality iwconfig reports for the interface, as a percentage when it reports "N/M";
// -1 when there is none.
int GetSignalStrength(const std::string& ifname);
// The same from iwconfig's "Link Quality" line, within 0..100.
int ParseLinkQuality(const std::string& line);

// The RLT radio's driver: "/sbin/insmod" "/usr/vorn/lib/modules/MODULE" and "/sbin/rmmod" NAME
// (MODULE without ".ko"). 0 or -1.
int InsertRLTKernelModule(const std::string& module = "rlt_wifi.ko");
int RemoveRLTKernelModule(const std::string& module = "rlt_wifi.ko");

// Whether the interface is up and running (the platform's link check).
bool IsNetActivate(const std::string& ifname);
// A station's address in the kernel's ARP table ("/proc/net/arp", complete entries only; MAC
// case ignored). 0, or -1 when it has none.
int GetArpInfoByMAC(const vornwireless::utils::MacAddress& mac, vornwireless::utils::IPAddress& ip);
// The host name of the station's lease in the DHCP server's lease file, read as the LAN device
// list reads it; "" when it has none. 0, or -1 when the file cannot be read.
int GetDHCPInfoByMAC(const vornwireless::utils::MacAddress& mac, std::string& hostname);

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless

#endif
