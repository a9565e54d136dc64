#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_HOSTAPD_BRIDGE_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_HOSTAPD_BRIDGE_H

#include <string>

#include "wifi/adapter/adapter_agent_hostapd.h"

namespace vornwireless {
namespace wifi {

// hostapd in bridge topology: the access point is a port of the LAN bridge "br0".
class AdapterAgentHostapdBridge : public AdapterAgentHostapd {
  public:
    explicit AdapterAgentHostapdBridge(const std::string& name) : AdapterAgentHostapd(name) {}
};

}  // namespace wifi
}  // namespace vornwireless

#endif
