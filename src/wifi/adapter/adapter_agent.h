#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_H

#include <string>
#include <vector>

#include "wifi/settings/adapter_config.h"
#include "wifi/settings/adapter_data.h"
#include "wifi/settings/enum.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {

// Drives the system daemons of one radio for its current role: access point or station.
class AdapterAgent {
  public:
    // Which agent class a radio gets.
    enum class Kind {
        kNone,
        kHostapdBridge,
        kHostapdRouter,
        kRLTBridge,
        kRLTRouter,
        kClient,
        kClientRLT
    };

    virtual ~AdapterAgent() = default;
    AdapterAgent(const AdapterAgent&) = delete;
    AdapterAgent& operator=(const AdapterAgent&) = delete;

    // By driver, model and the adapters' topology; kNone (logged) when there is none.
    static Kind Choose(const AdapterConfig& config, WIFI_TOPOLOGY topology);
    // The agent of that choice for config.name, or null (logged).
    static AdapterAgent* Create(const AdapterConfig& config);
    static int Delete(const AdapterAgent* agent);

    const std::string& GetName() const { return name_; }

    virtual int Enable(const AdapterConfig& config) = 0;
    // Brings the service back after a restart of the daemon, without changing settings.
    virtual int Recover(const AdapterConfig& config) = 0;
    virtual int Disable(const AdapterConfig& config) = 0;
    virtual int Reload(const AdapterConfig& config, RELOAD_STATUS status) = 0;
    virtual WIFI_STATUS GetStatus(const AdapterConfig& config) const = 0;
    virtual int ScanNetworks(const AdapterConfig& config,
                             std::vector<AdapterConfig::StationInfo>& stations) = 0;
    virtual int LoadStationConnData(std::vector<utils::ConnectionInfo>& connections) = 0;
    virtual int EnableWPSWithPBC() = 0;
    virtual int EnableWPSWithPinCode(const std::string& pin) = 0;

  protected:
    explicit AdapterAgent(const std::string& name) : name_(name) {}

    // The Kite A's radio switch (rfkill): whether the model has one, and turning it on or off
    // ("unblock", "block").
    static bool HasRadioSwitch();
    static int SwitchRadio(const char* action);
    // Turns the radio switch off once no adapter is enabled any more.
    int BlockRadioWhenUnused() const;
    // The name is one that may reach a command line (logged when not).
    bool IsNameValid() const;

  private:
    std::string name_;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
