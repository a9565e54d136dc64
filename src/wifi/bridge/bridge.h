#ifndef VORN_WIFI_BRIDGE_BRIDGE_H
#define VORN_WIFI_BRIDGE_BRIDGE_H

#include "wifi/bridge/bridge_base.h"

namespace vornwireless {
namespace wifi {

// "br0" of the bridge topology: joins "eth0" and the access points into one LAN and takes over
// eth0's address and security files; its own configuration is never changed by callers.
class Bridge : public BridgeBase {
  public:
    using BridgeBase::BridgeBase;

    int CreateConfig() override;
    int DisableTopology() override;
    int CreateGatewayInfo() override;
    int ResetGatewayInfo() override;
    int EnableNat() override { return 0; }
    int DisableNat() override { return 0; }
    // Suspends (and resumes) the primary slave's own DHCP server through "enable_bak".
    int EnableDhcp() override;
    int DisableDhcp() override;
    int EnableDhcpv6() override { return BridgeBase::EnableDhcpv6(); }
    int DisableDhcpv6() override { return BridgeBase::DisableDhcpv6(); }
    int EnableSecurityConf() override;
    int DisableSecurityConf() override;
    int ResetBridgeIP() override { return 0; }
    int SetTopologyFile(const BridgeConfig&) override { return 0; }

  private:
    // The primary slave, or "" (logged).
    std::string PrimarySlave() const;
    int MoveSecurityFiles(const std::string& from, const std::string& to) const;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
