#ifndef VORN_IPV6_ROUTER_ROUTER6_BASE_H
#define VORN_IPV6_ROUTER_ROUTER6_BASE_H

#include <string>
#include <vector>

#include "ipv6/router/router6_attr.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {

// Puts one WAN's IPv6 router settings into effect and takes them back. The kinds call the base
// parts of Create, Destroy and ValidateAttr after their own steps.
class Router6Base {
  public:
    explicit Router6Base(const Router6Attr& attr) : attr_(attr) {}
    virtual ~Router6Base() = default;

    virtual bool operator==(const Router6Base& other) const { return attr_ == other.attr_; }
    virtual bool operator!=(const Router6Base& other) const { return !(*this == other); }

    // Base part: saves the settings and marks the WAN's ifcfg file IPV6ROUTER=yes.
    virtual bool Create() const = 0;
    // Base part: removes the settings and marks IPV6ROUTER=no.
    virtual bool Destroy() const = 0;
    // Base part: refuses a bad type, WAN or LAN entry, then enables IPv6 on the WAN and IPv6
    // forwarding.
    virtual bool ValidateAttr() const = 0;

    bool SetSysConfig(bool on) const;
    bool AddLan(const std::string& lan, const std::string& prefix);
    bool RemoveLan(const std::string& lan, const std::string& prefix);

    const Router6Attr& Attr() const { return attr_; }

  protected:
    // Announces device as an IPv6 gateway, first (priority 0) when the settings make this WAN the
    // default gateway, else last (-1).
    bool AnnounceGateway(const std::string& device, const std::string& gateway) const;
    // Runs program with the argument words, without a shell, and waits; true on exit status 0.
    static bool Run(const char* program, const std::vector<std::string>& words);

    Router6Attr attr_;
};

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn

#endif
