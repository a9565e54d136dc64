#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_RLT_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_RLT_H

#include <ostream>
#include <string>
#include <vector>

#include "utils/ip_address.h"
#include "wifi/adapter/adapter_agent_ap.h"

namespace vornwireless {
namespace wifi {

// The kite-b model's built-in radio as an access point: its driver module "rlt_wifi.ko" reads
// the profile "/usr/vorn/etc/rlt_wifi/rlt_wifi.conf" when loaded, "/sbin/iwpriv" sets the rest,
// and "/usr/vorn/sbin/rt2860apd" serves enterprise authentication. The topology classes derive
// from it.
class AdapterAgentRLT : public AdapterAgentAP {
  public:
    // Enabled while the interface is up and running.
    WIFI_STATUS GetStatus(const AdapterConfig& config) const override;
    int ScanNetworks(const AdapterConfig&, std::vector<AdapterConfig::StationInfo>&) override {
        return 0;
    }
    // The stations of the driver's MAC table, with their LAN addresses.
    int LoadStationConnData(std::vector<utils::ConnectionInfo>& connections) override;
    int EnableWPSWithPBC() override;
    // pin: 4 or 8 digits.
    int EnableWPSWithPinCode(const std::string& pin) override;

    // Succeeds once the radio is up, even when a later step (rt2860apd, bridge, guest network,
    // WPS mode, access list) fails: those only log.
    int EnableAP(const AdapterConfig& config) override;
    int DisableAP(const AdapterConfig& config) override;
    int SetTXPower(const AdapterConfig& config) override;
    virtual int EnableAPGuest(const AdapterConfig& config);
    virtual int DisableAPGuest(const AdapterConfig& config);
    // The driver's access list: the enabled rules' MACs and the policy. 0 or -1.
    virtual int GenerateMacFilterConfig(const AdapterConfig& config);
    // The profile; a configuration whose texts would break a line or a ";" list is refused (-1,
    // logged) before the file changes.
    virtual int GenerateRLTConfig(const AdapterConfig& config);
    // The five authentication lines, then SetAuthDetail's; -1 only for a bad stream.
    int SetAuth(const AdapterConfig& config, std::ostream& out);
    // The RADIUS lines of the enterprise schemes; -1 for a scheme it does not know.
    int SetAuthDetail(const AdapterConfig& config, std::ostream& out);
    // Unloads and loads the driver, which then reads the profile.
    int ReloadKernelModule();

    // The interface that leads out of the appliance in this topology, and its IPv4 address.
    virtual std::string GetWanIfName() const = 0;
    vornwireless::utils::IPAddress GetWanIPAddress() const;

  protected:
    explicit AdapterAgentRLT(const std::string& name) : AdapterAgentAP(name) {}

  private:
    // "/sbin/iwpriv" IF "set" SETTING; 0 or what the program gave.
    int SetDriver(const std::string& ifname, const std::string& setting) const;

    bool apEnabled_ = false;
    bool guestEnabled_ = false;
};

// The radio in bridge topology: a port of "br0", which also leads out.
class AdapterAgentRLTBridge : public AdapterAgentRLT {
  public:
    explicit AdapterAgentRLTBridge(const std::string& name) : AdapterAgentRLT(name) {}
    std::string GetWanIfName() const override { return "br0"; }
};

// The radio in router topology: a port of "lbr0", routed out through "eth0".
class AdapterAgentRLTRouter : public AdapterAgentRLT {
  public:
    explicit AdapterAgentRLTRouter(const std::string& name) : AdapterAgentRLT(name) {}
    std::string GetWanIfName() const override { return "eth0"; }
    int Reload(const AdapterConfig& config, RELOAD_STATUS status) override {
        return ReloadRouter(config, status);
    }
};

}  // namespace wifi
}  // namespace vornwireless

#endif
