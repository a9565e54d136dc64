#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_AP_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_AP_H

#include <string>

#include "wifi/adapter/adapter_agent.h"

namespace vornwireless {
namespace wifi {

// An access point: what every access-point agent shares, the reload steps, the guest network's
// access rules and the hourly schedule.
class AdapterAgentAP : public AdapterAgent {
  public:
    using AdapterAgent::AdapterAgent;

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
};

}  // namespace wifi
}  // namespace vornwireless

#endif
