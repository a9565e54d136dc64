#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_HOSTAPD_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_HOSTAPD_H

#include <string>
#include <vector>

#include "wifi/adapter/adapter_agent_ap.h"

namespace vornwireless {
namespace wifi {

// An access point run by hostapd: writes the daemon's files for the main and the guest network,
// starts and stops it through the platform's network script, sets the transmit power, lists the
// connected stations and triggers WPS. The topology classes derive from it.
class AdapterAgentHostapd : public AdapterAgentAP {
  public:
    // Enabled while the interface is up and running.
    WIFI_STATUS GetStatus(const AdapterConfig& config) const override;
    int ScanNetworks(const AdapterConfig&, std::vector<AdapterConfig::StationInfo>&) override {
        return 0;
    }
    // The stations hostapd reports, each with the address and host name the LAN knows it by;
    // stations without an address are left out.
    int LoadStationConnData(std::vector<utils::ConnectionInfo>& connections) override;
    int EnableWPSWithPBC() override;
    // pin: 4 or 8 digits, valid for any enrollee for 120 s.
    int EnableWPSWithPinCode(const std::string& pin) override;

    int EnableAP(const AdapterConfig& config) override;
    int DisableAP(const AdapterConfig& config) override;
    // The level's share of the radio's maximum power on the configured channel; the power is
    // left alone when the maximum cannot be read.
    int SetTXPower(const AdapterConfig& config) override;

    // "/etc/hostapd/hostapd-mac.list" with the enabled rules; the number of them, or -1.
    virtual int GenerateMacFilterConfig(const AdapterConfig& config);
    // The five hostapd files. A configuration whose texts would break a line, or whose filter
    // policy is unknown while rules are on, is refused (-1, logged) before any file changes.
    virtual int GenerateHostapdConfig(const AdapterConfig& config);

    // The radio's maximum power in dBm from what the "iw phy0 info" pipeline prints ("20." of
    // "20.0 dBm"); 0 when it shows none or more than 100 dBm.
    static double ParseMaxPower(const std::string& text);
    // The lines of "hostapd_cli all_sta": a MAC address line starts a station, its
    // "connected_time=" line gives the station's connection time.
    static std::vector<utils::ConnectionInfo> ParseStations(const std::vector<std::string>& lines);

  protected:
    explicit AdapterAgentHostapd(const std::string& name) : AdapterAgentAP(name) {}

    // hostapd starts the radio at full power.
    void AfterEnableAP(const AdapterConfig& config) override { SetTXPower(config); }
};

}  // namespace wifi
}  // namespace vornwireless

#endif
