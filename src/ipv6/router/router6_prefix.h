#ifndef VORN_IPV6_ROUTER_ROUTER6_PREFIX_H
#define VORN_IPV6_ROUTER_ROUTER6_PREFIX_H

#include <string>
#include <vector>

#include "ipv6/router/router6_attr.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {

// Hands out /64 prefixes of the routed prefixes to LAN interfaces, recorded in the "lan" section
// of each router's settings. A native router's prefix, when its settings hold none, is the last
// one its DHCPv6 lease delegated.
class Router6Prefix {
  public:
    Router6Prefix();  // Load()

    // The settings of every router stored in "/etc/sysconfig/networking".
    bool Load();
    const std::vector<Router6Attr>& List() const { return routers_; }

    // Gives lan a free /64 of wan's prefix (keeps one it already has) and stores it.
    bool Allocate(const std::string& lan, const std::string& wan);
    bool Deallocate(const std::string& lan, const std::string& wan);
    // lan's /64 in attr, "" when it has none.
    std::string AllocatedTo(const std::string& lan, const Router6Attr& attr) const;

    // "2001:0db8:0::/48" -> "2001:db8::/48"; "" (logged) when it does not parse.
    static std::string NormalizePrefix(const std::string& prefix);
    // The /64 prefixes (address texts) of a prefix of that length: itself at 64, nothing beyond,
    // and below 64 exactly two, whose last network bit is 0 and 1.
    static std::vector<std::string> EnumPrefix64(const std::string& prefix, int length);

  private:
    Router6Attr* Find(const std::string& wan);

    std::vector<Router6Attr> routers_;
};

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn

#endif
