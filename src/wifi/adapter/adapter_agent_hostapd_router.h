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
    int Reload(const AdapterConfig& config, RELOAD_STATUS status) override {
        return ReloadRouter(config, status);
    }
};

}  // namespace wifi
}  // namespace vornwireless

#endif
