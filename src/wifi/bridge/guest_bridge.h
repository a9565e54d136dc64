#ifndef VORN_WIFI_BRIDGE_GUEST_BRIDGE_H
#define VORN_WIFI_BRIDGE_GUEST_BRIDGE_H

#include "wifi/bridge/bridge_base.h"

namespace vornwireless {
namespace wifi {

// "gbrN": the guest network, a separate NATed LAN whose slave is "gwlanN".
class GuestBridge : public BridgeBase {
  public:
    using BridgeBase::BridgeBase;

    int CreateConfig() override;
    int RemoveSlave() override { return 0; }
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
    int ResetBridgeIP() override { return 0; }
    // Into the router and the bridge topology files, so the guest network survives a switch.
    int SetTopologyFile(const BridgeConfig& config) override;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
