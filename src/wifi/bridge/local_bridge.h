#ifndef VORN_WIFI_BRIDGE_LOCAL_BRIDGE_H
#define VORN_WIFI_BRIDGE_LOCAL_BRIDGE_H

#include "wifi/bridge/bridge_base.h"

namespace vornwireless {
namespace wifi {

// "lbr0" of the router topology: the private LAN with its own address, NAT, DHCP and DHCPv6.
class LocalBridge : public BridgeBase {
  public:
    using BridgeBase::BridgeBase;

    int CreateConfig() override;
    int CreateGatewayInfo() override;
    int ResetGatewayInfo() override;
    int EnableNat() override;
    int DisableNat() override;
    int EnableDhcp() override { return BridgeBase::EnableDhcp(); }
    int DisableDhcp() override { return BridgeBase::DisableDhcp(); }
    int EnableDhcpv6() override { return BridgeBase::EnableDhcpv6(); }
    int DisableDhcpv6() override { return BridgeBase::DisableDhcpv6(); }
    int EnableSecurityConf() override { return 0; }
    int DisableSecurityConf() override { return 0; }
    // Gives the bridge its first slave's MAC address.
    int ResetBridgeIP() override;
    int SetTopologyFile(const BridgeConfig& config) override;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
