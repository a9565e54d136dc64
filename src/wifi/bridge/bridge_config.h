#ifndef VORN_WIFI_BRIDGE_BRIDGE_CONFIG_H
#define VORN_WIFI_BRIDGE_BRIDGE_CONFIG_H

#include <map>
#include <string>
#include <vector>

#include "utils/ip_address.h"

namespace vornwireless {
namespace wifi {

// The settings of one bridge; also one section of a topology file.
struct BridgeConfig {
    using Fields = std::map<std::string, std::string>;

    vornwireless::utils::IPAddress apIpAddress;
    vornwireless::utils::IPAddress apNetmask;
    bool dhcpEnabled = false;
    vornwireless::utils::IPAddress dhcpRangeBegin;
    vornwireless::utils::IPAddress dhcpRangeEnd;
    std::string ipv6Prefix;  // "PREFIX" + "1" is the bridge's own address
    std::string ipv6Pdns;
    std::string ipv6Sdns;
    std::string dhcpv6Type;  // "ra-only", "ra-stateless", "stateful" or empty
    std::string dhcpv6RangeBegin;
    std::string dhcpv6RangeEnd;
    std::vector<std::string> slaveList;  // the first one is the primary slave

    // The topology-file keys with their texts ("dhcp_enabled" "yes"/"no", slaves joined by
    // blanks), in file order.
    static const std::vector<std::string>& Keys();
    Fields ToFields() const;

    // Builds a configuration from the texts of the keys present (absent keys stay empty). Refuses
    // (log line, -1, out unchanged) addresses that do not parse, a netmask that is not a mask, a
    // DHCP range outside the subnet or reversed, IPv6 texts that are not addresses, an unknown
    // DHCPv6 type, a stateful type without its range, bad slave names, and any line break.
    static int FromFields(const Fields& fields, BridgeConfig& out);
};

}  // namespace wifi
}  // namespace vornwireless

#endif
