#include "ipv6/router/router6_factory.h"

#include <arpa/inet.h>

#include <cstdio>
#include <new>

#include "ipv6/router/6in4.h"
#include "ipv6/router/dhcp_pd.h"
#include "utils/ip_address.h"
#include "utils/log.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {
namespace {

// The 6to4 relay anycast address (RFC 3068).
const char kRelay[] = "192.88.99.1";

// A required text of the request; a missing or non-text one is logged.
bool Text(const Json::Value& request, const char* key, std::string& value) {
    if (!request.isObject() || !request.isMember(key)) {
        VORN_LOG(LOG_ERR, "Missing field: %s", key);
        return false;
    }
    if (!request[key].isString()) {
        VORN_LOG(LOG_ERR, "Bad field: %s", key);
        return false;
    }
    value = request[key].asString();
    return true;
}

// The optional flag, false when absent; anything else than a boolean is refused.
bool DefaultGatewayFlag(const Json::Value& request, bool& flag) {
    const Json::Value& value = request.get("is_default_gateway", false);
    if (!value.isBool()) {
        VORN_LOG(LOG_ERR, "Bad field: %s", "is_default_gateway");
        return false;
    }
    flag = value.asBool();
    return true;
}

bool Wan(const Json::Value& request, const std::string& type, std::string& wan) {
    if (!Text(request, "wan", wan)) {
        return false;
    }
    if (!IsValidWan(wan, type)) {
        VORN_LOG(LOG_ERR, "Invalid wan interface [%s]", wan.c_str());
        return false;
    }
    return true;
}

// The WAN's first IPv4 address, "" (logged) when it has none.
std::string PublicIPv4(const std::string& wan) {
    const std::string device = Router6Attr::ConvertInterface(wan);
    const auto addresses = vornwireless::utils::IPAddress::GetIPv4Address(device);
    if (addresses.empty()) {
        VORN_LOG(LOG_ERR, "Unable to retrieve public IPv4 on %s", device.c_str());
        return "";
    }
    return addresses.front().first;
}

}  // namespace

std::unique_ptr<Router6Base> Router6Factory::newRouterV6Instance(const std::string& type,
                                                                 const Json::Value& request) {
    std::unique_ptr<Router6Attr> attr;
    if (type == "6in4") {
        attr = new6in4Attr(request);
    } else if (type == "6to4") {
        attr = new6to4Attr(request);
    } else if (type == "native") {
        attr = newDHCPPDAttr(request);
    } else if (type != "off") {
        VORN_LOG(LOG_ERR, "Bad type: %s", type.c_str());
    }
    return attr != nullptr ? newRouterV6InstanceImpl(*attr) : nullptr;
}

std::unique_ptr<Router6Base> Router6Factory::newRouterV6Instance(const Json::Value& request) {
    std::string wan;
    if (!Text(request, "wan", wan)) {
        return nullptr;
    }
    return newRouterV6Instance(wan);
}

std::unique_ptr<Router6Base> Router6Factory::newRouterV6Instance(const std::string& wan) {
    Router6Attr attr(wan, false);
    if (attr.LoadConfig() != 0) {
        VORN_LOG(LOG_ERR, "No IPv6 router config for %s available", wan.c_str());
        return nullptr;
    }
    return newRouterV6InstanceImpl(attr);
}

std::unique_ptr<Router6Base> Router6Factory::newRouterV6InstanceImpl(const Router6Attr& attr) {
    std::unique_ptr<Router6Base> router;
    if (IsTunnelType(attr.type)) {
        router.reset(new (std::nothrow) Tunnel6in4(attr));
    } else if (attr.type == "native") {
        router.reset(new (std::nothrow) DHCPPD(attr));
    } else if (attr.type == "off") {
        VORN_LOG(LOG_ERR, "No existing ipv6 router config");
        return nullptr;
    } else {
        VORN_LOG(LOG_ERR, "Bad type: %s, should not reach here", attr.type.c_str());
        return nullptr;
    }
    if (router == nullptr) {
        VORN_LOG(LOG_ERR, "No free mem!");
        return nullptr;
    }
    if (!router->ValidateAttr()) {
        VORN_LOG(LOG_ERR, "Failed to validate attr, possiblely wrong parameters?");
        return nullptr;
    }
    return router;
}

std::unique_ptr<Router6Attr> Router6Factory::new6in4Attr(const Json::Value& request) {
    std::string wan, prefix, remote, localV6;
    bool isDefault = false;
    if (!Wan(request, "6in4", wan) || !Text(request, "prefix", prefix) ||
        !Text(request, "remote_addr_v4", remote) || !Text(request, "local_addr_v6", localV6) ||
        !DefaultGatewayFlag(request, isDefault)) {
        return nullptr;
    }
    if (!IsIPv6Prefix(prefix)) {
        VORN_LOG(LOG_ERR, "Invalid IPv6 prefix: [%s]", prefix.c_str());
        return nullptr;
    }
    if (!IsIPv4Address(remote)) {
        VORN_LOG(LOG_ERR, "Invalid remote v4 address (%s)", remote.c_str());
        return nullptr;
    }
    if (!IsIPv6Prefix(localV6)) {
        VORN_LOG(LOG_ERR, "Invalid local v6 address (%s)", localV6.c_str());
        return nullptr;
    }
    const std::string local = PublicIPv4(wan);
    if (local.empty()) {
        return nullptr;
    }
    return std::make_unique<Router6Attr>("6in4", wan, prefix, local, remote, localV6, isDefault);
}

std::unique_ptr<Router6Attr> Router6Factory::new6to4Attr(const Json::Value& request) {
    std::string wan;
    Json::Value tunnel;
    if (!Wan(request, "6to4", wan)) {
        return nullptr;
    }
    const std::string local = PublicIPv4(wan);
    if (local.empty() || !Make6to4Request(request, local, tunnel)) {
        return nullptr;
    }
    std::unique_ptr<Router6Attr> attr = new6in4Attr(tunnel);
    if (attr != nullptr) {
        attr->type = "6to4";
    }
    return attr;
}

std::unique_ptr<Router6Attr> Router6Factory::newDHCPPDAttr(const Json::Value& request) {
    std::string wan;
    bool isDefault = false;
    if (!Wan(request, "native", wan) || !DefaultGatewayFlag(request, isDefault)) {
        return nullptr;
    }
    return std::make_unique<Router6Attr>(wan, isDefault);
}

bool Router6Factory::Make6to4Request(const Json::Value& request, const std::string& publicIPv4,
                                     Json::Value& out) {
    in_addr address;
    if (inet_pton(AF_INET, publicIPv4.c_str(), &address) != 1) {
        VORN_LOG(LOG_ERR, "Failed to parse local v4 IPaddr [%s]", publicIPv4.c_str());
        return false;
    }
    const uint32_t host = ntohl(address.s_addr);
    const unsigned a = host >> 24, b = (host >> 16) & 0xff, c = (host >> 8) & 0xff, d = host & 0xff;
    char prefix[64];
    char local[64];
    std::snprintf(prefix, sizeof(prefix), "2002:%02x%02x:%02x%02x::/48", a, b, c, d);
    std::snprintf(local, sizeof(local), "2002:%02x%02x:%02x%02x::1/16", a, b, c, d);
    out = Json::Value(Json::objectValue);
    out["wan"] = request.get("wan", "");
    out["is_default_gateway"] = request.get("is_default_gateway", false);
    out["prefix"] = prefix;
    out["local_addr_v6"] = local;
    out["remote_addr_v4"] = kRelay;
    return true;
}

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn
