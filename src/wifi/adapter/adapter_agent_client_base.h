#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_CLIENT_BASE_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_CLIENT_BASE_H

#include <chrono>
#include <string>
#include <vector>

#include "wifi/adapter/adapter_agent.h"

namespace vornwireless {
namespace wifi {

// A station client: joins another network instead of serving one. Holds the network it works on
// (the last of the stored stations), the choice between infrastructure and ad-hoc operation, the
// address setup after connecting and the gateway clean-up; the radio itself is the subclass's.
class AdapterAgentClientBase : public AdapterAgent {
  public:
    // Connects to the chosen network when client_enabled, else disconnects.
    int Enable(const AdapterConfig& config) override;
    int Recover(const AdapterConfig& config) override;
    int Disable(const AdapterConfig& config) override;
    // Ignores the flags: in ad-hoc operation Recover, else Enable or Disable by client_enabled.
    int Reload(const AdapterConfig& config, RELOAD_STATUS status) override;
    // A station serves no stations and runs no WPS registrar.
    int LoadStationConnData(std::vector<utils::ConnectionInfo>& connections) override;
    int EnableWPSWithPBC() override;
    int EnableWPSWithPinCode(const std::string& pin) override;

    // Brings the interface up when it is down, then QuickScanNetworks.
    int ScanNetworks(const AdapterConfig& config,
                     std::vector<AdapterConfig::StationInfo>& stations) override;
    // The networks of "iwlist IF scanning vorn", added to stations.
    virtual int QuickScanNetworks(const AdapterConfig& config,
                                  std::vector<AdapterConfig::StationInfo>& stations);
    // Takes the network to join from the configuration, the one last added to the stored
    // stations; -1 when it has none.
    virtual int GetClientConfig(const AdapterConfig& config);
    // Disconnect, connect, then the serialised restart of the network services.
    virtual int ClientEnable(const AdapterConfig& config);
    virtual int ClientRecover(const AdapterConfig& config) = 0;
    // Disconnects and leaves client topology: the gateway record and multi-gateway rules go.
    virtual int ClientDisable(const AdapterConfig& config);
    virtual int AdHocEnable(const AdapterConfig& config) = 0;
    virtual int AdHocRecover(const AdapterConfig& config) = 0;
    virtual int AdHocDisable(const AdapterConfig& config) = 0;
    virtual int DoConnecting() = 0;
    virtual int DoDisconnect() = 0;

    // The security word of a scan entry (e.g. "WPA1WPA2PSKTKIPAES"). 0, or -1 (logged) when
    // either part cannot be told.
    // One network per line of "iwlist IF scanning vorn" (docs/wifi.md): "BSSID CHANNEL SIGNAL
    // MODE HWMODE SECURITY ESSID-HEX". Lines that are not of that form are left out.
    static std::vector<AdapterConfig::StationInfo> ParseScanList(
        const std::vector<std::string>& lines);
    static int ParseSecurityEncryption(const std::string& word, WIFI_SECURITY& security,
                                       WIFI_ENCRYPTION& encryption);
    // The pause between two polls of a running program (1 s; tests shorten it).
    static void SetPollInterval(std::chrono::milliseconds interval);
    // Starts the network services restart in a child of its own and returns at once: the child
    // waits (bounded) while a topology switch holds "/tmp/topology.lock", which may be this very
    // process. Skipped while an earlier restart still runs. 0, or -1 when no child could start.
    static int RestartServices();

  protected:
    using AdapterAgent::AdapterAgent;

    static void Pause();
    const AdapterConfig::StationInfo& Station() const { return station_; }
    bool IsAdHoc() const { return adhoc_; }
    void SetStation(const AdapterConfig::StationInfo& station);
    // The address of the joined network: DHCP, the stored static address, or for an ad-hoc
    // network that gets none a random one of 10.42.43.0/24; each chosen address is checked for
    // another host answering for it first. Sets the IP status GetStatus reports. 0 or -1.
    int SetupAddress();
    // Stops the DHCP client instance of the interface.
    int StopDhcpClient() const;
    // Announces the loss of the interface's IPv4 gateway and its multi-gateway routes.
    int RemoveGateway() const;
    WIFI_STATUS IpStatus() const { return ipStatus_; }

  private:
    int UseAddress(const std::string& ip, const std::string& netmask, const std::string& gateway);
    int UseDhcp();
    int UseRandomAdHocAddress();
    bool IsAddressFree(const std::string& ip) const;

    AdapterConfig::StationInfo station_;
    bool adhoc_ = false;
    WIFI_STATUS ipStatus_ = WIFI_STATUS_ENABLED;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
