#include "wifi/bridge/bridge_config.h"

#include <arpa/inet.h>

#include <cstdint>
#include <sstream>

#include "utils/interface_name.h"
#include "utils/log.h"

namespace vornwireless {
namespace wifi {
namespace {

using Fields = BridgeConfig::Fields;

bool ParseIPv4(const std::string& text, uint32_t& address) {
    in_addr binary{};
    if (inet_pton(AF_INET, text.c_str(), &binary) != 1) {
        return false;
    }
    address = ntohl(binary.s_addr);
    return true;
}

bool IsIPv6(const std::string& text) {
    in6_addr binary{};
    return inet_pton(AF_INET6, text.c_str(), &binary) == 1;
}

bool IsMask(uint32_t mask) {
    return mask != 0 && ((~mask + 1) & ~mask) == 0;
}

std::string Get(const Fields& fields, const char* key) {
    const auto found = fields.find(key);
    return found == fields.end() ? "" : found->second;
}

// Empty, or a dotted quad whose value goes into address.
bool OptionalIPv4(const Fields& fields, const char* key, uint32_t& address, bool& present) {
    const std::string text = Get(fields, key);
    present = !text.empty();
    return !present || ParseIPv4(text, address);
}

// The reason the IPv4 part is refused, or "".
std::string CheckIPv4(const Fields& fields) {
    uint32_t ap = 0, mask = 0, begin = 0, end = 0;
    bool hasAp = false, hasMask = false, hasBegin = false, hasEnd = false;
    if (!OptionalIPv4(fields, "ap_ip_address", ap, hasAp) ||
        !OptionalIPv4(fields, "ap_netmask", mask, hasMask) ||
        !OptionalIPv4(fields, "dhcp_range_begin", begin, hasBegin) ||
        !OptionalIPv4(fields, "dhcp_range_end", end, hasEnd)) {
        return "an IPv4 address does not parse";
    }
    if (hasAp != hasMask || (hasMask && !IsMask(mask))) {
        return "the netmask is not a mask of the address";
    }
    if (hasBegin != hasEnd || (hasBegin && !hasAp)) {
        return "the DHCP range is incomplete";
    }
    if (hasBegin && ((begin & mask) != (ap & mask) || (end & mask) != (ap & mask) || begin > end)) {
        return "the DHCP range is outside the subnet or reversed";
    }
    return "";
}

std::string CheckIPv6(const Fields& fields) {
    const std::string prefix = Get(fields, "ap_ipv6_prefix");
    if (!prefix.empty() && !IsIPv6(prefix + "1")) {
        return "the IPv6 prefix is not an address prefix";
    }
    for (const char* key : {"ipv6_pdns", "ipv6_sdns", "dhcpv6_range_begin", "dhcpv6_range_end"}) {
        const std::string text = Get(fields, key);
        if (!text.empty() && !IsIPv6(text)) {
            return std::string(key) + " is not an IPv6 address";
        }
    }
    const std::string type = Get(fields, "dhcpv6_type");
    if (!type.empty() && type != "ra-only" && type != "ra-stateless" && type != "stateful") {
        return "unknown dhcpv6_type";
    }
    if (type == "stateful" &&
        (Get(fields, "dhcpv6_range_begin").empty() || Get(fields, "dhcpv6_range_end").empty())) {
        return "a stateful DHCPv6 server needs its range";
    }
    return "";
}

std::vector<std::string> SplitBlanks(const std::string& text) {
    std::istringstream words(text);
    std::vector<std::string> out;
    for (std::string word; words >> word;) {
        out.push_back(word);
    }
    return out;
}

std::string CheckSlaves(const std::vector<std::string>& slaves) {
    for (const auto& slave : slaves) {
        if (!vornwireless::utils::IsValidInterfaceName(slave)) {
            return "a slave is not an interface name";
        }
    }
    return "";
}

bool HasLineBreak(const Fields& fields) {
    for (const auto& field : fields) {
        if (field.second.find_first_of(std::string("\r\n\0", 3)) != std::string::npos) {
            return true;
        }
    }
    return false;
}

}  // namespace

const std::vector<std::string>& BridgeConfig::Keys() {
    static const std::vector<std::string> keys = {
        "ap_ip_address",  "ap_netmask",         "dhcp_enabled",     "dhcp_range_begin",
        "dhcp_range_end", "ap_ipv6_prefix",     "ipv6_pdns",        "ipv6_sdns",
        "dhcpv6_type",    "dhcpv6_range_begin", "dhcpv6_range_end", "slave_list"};
    return keys;
}

BridgeConfig::Fields BridgeConfig::ToFields() const {
    std::string slaves;
    for (const auto& slave : slaveList) {
        slaves += (slaves.empty() ? "" : " ") + slave;
    }
    return {{"ap_ip_address", apIpAddress},
            {"ap_netmask", apNetmask},
            {"dhcp_enabled", dhcpEnabled ? "yes" : "no"},
            {"dhcp_range_begin", dhcpRangeBegin},
            {"dhcp_range_end", dhcpRangeEnd},
            {"ap_ipv6_prefix", ipv6Prefix},
            {"ipv6_pdns", ipv6Pdns},
            {"ipv6_sdns", ipv6Sdns},
            {"dhcpv6_type", dhcpv6Type},
            {"dhcpv6_range_begin", dhcpv6RangeBegin},
            {"dhcpv6_range_end", dhcpv6RangeEnd},
            {"slave_list", slaves}};
}

int BridgeConfig::FromFields(const Fields& fields, BridgeConfig& out) {
    const std::vector<std::string> slaves = SplitBlanks(Get(fields, "slave_list"));
    std::string why = HasLineBreak(fields) ? "a value holds a line break" : CheckIPv4(fields);
    if (why.empty()) {
        why = CheckIPv6(fields);
    }
    if (why.empty()) {
        why = CheckSlaves(slaves);
    }
    if (!why.empty()) {
        VORN_LOG(LOG_ERR, "Refused bridge config: %s", why.c_str());
        return -1;
    }
    out.apIpAddress = Get(fields, "ap_ip_address");
    out.apNetmask = Get(fields, "ap_netmask");
    out.dhcpEnabled = Get(fields, "dhcp_enabled") == "yes";
    out.dhcpRangeBegin = Get(fields, "dhcp_range_begin");
    out.dhcpRangeEnd = Get(fields, "dhcp_range_end");
    out.ipv6Prefix = Get(fields, "ap_ipv6_prefix");
    out.ipv6Pdns = Get(fields, "ipv6_pdns");
    out.ipv6Sdns = Get(fields, "ipv6_sdns");
    out.dhcpv6Type = Get(fields, "dhcpv6_type");
    out.dhcpv6RangeBegin = Get(fields, "dhcpv6_range_begin");
    out.dhcpv6RangeEnd = Get(fields, "dhcpv6_range_end");
    out.slaveList = slaves;
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
