#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_AP_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_AP_H

#include <string>
#include <vector>

#include "wifi/adapter/adapter_agent.h"

namespace vornwireless {
namespace wifi {

// An access point: what every access-point agent shares, the reload steps, the guest network's
// access rules and the hourly schedule.
class AdapterAgentAP : public AdapterAgent {
  public:
    using AdapterAgent::AdapterAgent;

    // EnableAP, guest rules, schedule; the first failure ends it.
    int Enable(const AdapterConfig& config) override;
    int Recover(const AdapterConfig& config) override { return Enable(config); }
    // The reverse: schedule, guest rules, DisableAP.
    int Disable(const AdapterConfig& config) override;
    // Restart, transmit power, guest rules, schedule: each step only when its flag is set.
    int Reload(const AdapterConfig& config, RELOAD_STATUS status) override;

    virtual int EnableAP(const AdapterConfig& config) = 0;
    virtual int DisableAP(const AdapterConfig& config) = 0;
    virtual int SetTXPower(const AdapterConfig& config) = 0;
    // The guest network's firewall rules, through the platform's guest-network script.
    virtual int EnableRuleGuest(const AdapterConfig& config);
    virtual int DisableRuleGuest(const AdapterConfig& config);
    // An hourly crontab entry running this radio's copy of the wifi tool, or none when no
    // schedule is on.
    virtual int SetSchedule(const AdapterConfig& config);
    virtual int RemoveSchedule(const AdapterConfig& config);

    // "/tmp/vornwireless." + name: the tool copy the entry runs.
    static std::string ScheduleTool(const std::string& ifname);
    static std::string ScheduleCommand(const std::string& ifname);

  protected:
    // Between EnableAP and the guest rules in Enable; its failure is ignored.
    virtual void AfterEnableAP(const AdapterConfig&) {}
    // Reload for the router topology: a restarted access point leaves lbr0 without its address,
    // so the bridge is repaired right after the restart.
    int ReloadRouter(const AdapterConfig& config, RELOAD_STATUS status);
    // Each station with the address the LAN knows it by (and, in router topology, the host name
    // of its lease) into connections; stations without an address are left out.
    static void AddConnections(std::vector<utils::ConnectionInfo> stations,
                               std::vector<utils::ConnectionInfo>& connections);
    // A WPS PIN that may reach a command line: 4 or 8 digits.
    static bool IsWpsPin(const std::string& pin);

  private:
    // An empty lbr0 keeps the radio's MAC, otherwise the bridge gets its IP address back.
    static int RepairLocalBridge(const AdapterConfig& config);
};

}  // namespace wifi
}  // namespace vornwireless

#endif
