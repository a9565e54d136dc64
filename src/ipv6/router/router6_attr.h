#ifndef VORN_IPV6_ROUTER_ROUTER6_ATTR_H
#define VORN_IPV6_ROUTER_ROUTER6_ATTR_H

#include <json/json.h>

#include <string>
#include <utility>
#include <vector>

#include "platform/qlibc_container.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {

// The IPv6 router settings of one WAN interface: "native" (DHCPv6 prefix delegation), "6in4" or
// "6to4". Kept in "/etc/sysconfig/networking/ipv6-" + the converted WAN name, sections "conf",
// "addr" and "lan" (one key per LAN, its allocated prefix as value).
class Router6Attr {
  public:
    using LanList = std::vector<std::pair<std::string, std::string>>;

    Router6Attr() = default;
    Router6Attr(const std::string& kind, const std::string& wanName, const std::string& routed,
                const std::string& localAddrV4, const std::string& remoteAddrV4,
                const std::string& localAddrV6, bool isDefaultGateway);
    Router6Attr(const std::string& wanName, bool isDefaultGateway);

    bool operator==(const Router6Attr& other) const;
    bool operator!=(const Router6Attr& other) const { return !(*this == other); }

    // "pppoe" names the current PPPoE interface ("" when there is none); others pass unchanged.
    static std::string ConvertInterface(const std::string& name);
    // The tunnel device of a WAN: "6in4-" + the converted name.
    static std::string TunnelName(const std::string& wan);

    std::string GetConfigName() const;
    // -1 when the file is missing (a warning) or unreadable; the default-gateway flag is asked
    // of the route module.
    int LoadConfig();
    int SaveConfig() const;
    int RemoveConfig() const;

    // Replaces the value of a LAN already listed.
    void AddLan(const std::string& lan, const std::string& value);
    // Removes lan's entry; a non-empty value must match it too.
    void RemoveLan(const std::string& lan, const std::string& value);
    // The value kept for lan, "" when it is not listed.
    std::string LanValue(const std::string& lan) const;

    // {"config": {"wan", "prefix", "remote_addr_v4", "local_addr_v6"}, "type",
    //  "is_default_gateway"}; empty texts are left out, and the local IPv4 end appears (as
    // "remote_addr_v4") only while the remote end is empty.
    Json::Value ToJson() const;

    // Each returns the number of failed puts.
    int GenConfSection(QLIBSZHASH* hash) const;
    int GenAddrSection(QLIBSZHASH* hash) const;
    int GenPrefSection(QLIBSZHASH* hash) const;
    void GetConfSection(const QLIBSZHASH* hash);
    void GetAddrSection(const QLIBSZHASH* hash);
    void GetPrefSection(const QLIBSZHASH* hash);

    std::string type = "native";
    std::string wan;
    std::string prefix;
    std::string local_addr_v4;
    std::string remote_addr_v4;
    std::string local_addr_v6;
    LanList lan;
    bool is_default_gateway = false;
};

// Checks of texts that come from requests and files, before they reach a file or a command.
// "2001:db8::/48": an IPv6 address and a length of 0 to 128.
bool IsIPv6Prefix(const std::string& text);
// A dotted-quad IPv4 address.
bool IsIPv4Address(const std::string& text);
// A WAN as configured: "pppoe" or an interface name; for the tunnel kinds one short enough that
// "6in4-" + name is an interface name too.
bool IsValidWan(const std::string& wan, const std::string& type);
bool IsTunnelType(const std::string& type);

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn

#endif
