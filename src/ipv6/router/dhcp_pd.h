#ifndef VORN_IPV6_ROUTER_DHCP_PD_H
#define VORN_IPV6_ROUTER_DHCP_PD_H

#include <string>

#include "ipv6/router/router6_base.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {

// The "native" kind: dhclient asks the WAN's DHCPv6 server for a delegated prefix.
class DHCPPD : public Router6Base {
  public:
    explicit DHCPPD(const Router6Attr& attr);

    bool operator==(const Router6Base& other) const override;
    bool operator!=(const Router6Base& other) const override { return !(*this == other); }

    bool Create() const override;
    // Stops dhclient without releasing the lease, then the base part.
    bool Destroy() const override;
    // The WAN is up.
    bool ValidateAttr() const override;

    // Starts the lease file with the client's DUID, so that the server knows it again.
    bool GenerateLeaseFile() const;

    // Logical paths.
    const std::string& LeaseFile() const { return lease_file_; }
    const std::string& PidFile() const { return pid_file_; }

  private:
    bool RunClient(const char* mode) const;

    std::string lease_file_;
    std::string pid_file_;
};

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn

#endif
