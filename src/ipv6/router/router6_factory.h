#ifndef VORN_IPV6_ROUTER_ROUTER6_FACTORY_H
#define VORN_IPV6_ROUTER_ROUTER6_FACTORY_H

#include <json/json.h>

#include <memory>
#include <string>

#include "ipv6/router/router6_attr.h"
#include "ipv6/router/router6_base.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {

// Builds routers from requests or stored settings. Every router it returns passed ValidateAttr;
// null means no router (logged, except for the type "off").
class Router6Factory {
  public:
    // type "native", "6in4", "6to4" or "off", with the request's fields of that kind.
    static std::unique_ptr<Router6Base> newRouterV6Instance(const std::string& type,
                                                            const Json::Value& request);
    // The stored settings of request["wan"].
    static std::unique_ptr<Router6Base> newRouterV6Instance(const Json::Value& request);
    static std::unique_ptr<Router6Base> newRouterV6Instance(const std::string& wan);
    static std::unique_ptr<Router6Base> newRouterV6InstanceImpl(const Router6Attr& attr);

    // "wan", "prefix", "remote_addr_v4", "local_addr_v6" required, "is_default_gateway"
    // optional; the local IPv4 end is the WAN's first IPv4 address.
    static std::unique_ptr<Router6Attr> new6in4Attr(const Json::Value& request);
    // "wan" required: the prefix, local address and relay follow from the WAN's IPv4 address.
    static std::unique_ptr<Router6Attr> new6to4Attr(const Json::Value& request);
    // "wan" required.
    static std::unique_ptr<Router6Attr> newDHCPPDAttr(const Json::Value& request);

    // The 6in4 request of a 6to4 router whose public address is publicIPv4 (10.1.2.3 gives the
    // prefix 2002:0a01:0203::/48). false when the address is no dotted quad.
    static bool Make6to4Request(const Json::Value& request, const std::string& publicIPv4,
                                Json::Value& out);
};

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn

#endif
