#ifndef VORN_IPV6_ROUTER_6IN4_H
#define VORN_IPV6_ROUTER_6IN4_H

#include "ipv6/router/router6_base.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {

// A SIT tunnel "6in4-" + WAN for the "6in4" and "6to4" kinds, announced as an IPv6 gateway.
class Tunnel6in4 : public Router6Base {
  public:
    using Router6Base::Router6Base;

    bool Create() const override;
    bool Destroy() const override;
    // Both IPv4 ends are dotted quads, the local IPv6 address and the prefix carry a length.
    bool ValidateAttr() const override;
};

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn

#endif
