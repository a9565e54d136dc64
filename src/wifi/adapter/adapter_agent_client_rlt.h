#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_CLIENT_RLT_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_CLIENT_RLT_H

#include <string>

#include "wifi/adapter/adapter_agent_client_base.h"

namespace vornwireless {
namespace wifi {

// A station client on the kite-b model's built-in radio: its driver reads the network to join
// from "/usr/vorn/etc/rlt_wifi/rlt_wifi_sta.conf" when loaded, and "/sbin/iwpriv IF connStatus"
// tells whether it joined (docs/wifi.md). The driver joins infrastructure networks only.
class AdapterAgentClientRLT : public AdapterAgentClientBase {
  public:
    explicit AdapterAgentClientRLT(const std::string& name) : AdapterAgentClientBase(name) {}

    // Enabled once joined (or the address status after it), Enabling while the interface is up
    // but not joined, else Disabled.
    WIFI_STATUS GetStatus(const AdapterConfig& config) const override;
    // Nothing while joined, else ClientEnable.
    int ClientRecover(const AdapterConfig& config) override;
    int AdHocEnable(const AdapterConfig& config) override;
    int AdHocRecover(const AdapterConfig& config) override { return AdHocEnable(config); }
    int AdHocDisable(const AdapterConfig&) override { return DoDisconnect(); }
    // Writes the station file, reloads the driver, brings the interface up, waits up to 15
    // polls for the join and sets up the address.
    int DoConnecting() override;
    // Leaves the network, stops the address and takes the interface down.
    int DoDisconnect() override;

    // The station file for a network. Refused (-1, logged): an essid of 0 or over 32 bytes, a
    // text holding ";", a line break or a NUL, the enterprise schemes, a key of the wrong form.
    static int StationConfigText(const AdapterConfig::StationInfo& station, std::string& text);

  private:
    bool IsJoined() const;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
