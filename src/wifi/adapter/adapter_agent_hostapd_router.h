#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_HOSTAPD_ROUTER_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_HOSTAPD_ROUTER_H

#include <string>

#include "wifi/adapter/adapter_agent_hostapd.h"

namespace vornwireless {
namespace wifi {

// hostapd in router topology: the access point serves the appliance's routed LAN bridge "lbr0".
class AdapterAgentHostapdRouter : public AdapterAgentHostapd {
  public:
    explicit AdapterAgentHostapdRouter(const std::string& name) : AdapterAgentHostapd(name) {}

    // As every access point, with lbr0 repaired right after a restart.
    int Reload(const AdapterConfig& config, RELOAD_STATUS status) override;

  private:
    // A restarted access point leaves lbr0 without its address: an empty lbr0 keeps the radio's
    // MAC, otherwise the bridge gets its IP address back.
    int RepairLocalBridge(const AdapterConfig& config);
};

}  // namespace wifi
}  // namespace vornwireless

#endif
