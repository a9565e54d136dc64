#ifndef VORN_WIFI_ADAPTER_ADAPTER_H
#define VORN_WIFI_ADAPTER_ADAPTER_H

#include <chrono>
#include <cstdint>
#include <ctime>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "utils/mac_address.h"
#include "wifi/adapter/adapter_agent.h"
#include "wifi/settings/adapter_capability.h"
#include "wifi/settings/adapter_data.h"
#include "wifi/settings/enum.h"

namespace vornwireless {
namespace wifi {

// One wireless interface under management: its stored configuration, what its radio can do, and
// the agent that drives the system daemons for its role. The process keeps one list of them.
class Adapter {
  public:
    using List = std::vector<std::unique_ptr<Adapter>>;

    Adapter(std::unique_ptr<AdapterAgent> agent, std::unique_ptr<AdapterData> data,
            std::unique_ptr<AdapterCapability> capability);
    Adapter(const Adapter&) = delete;
    Adapter& operator=(const Adapter&) = delete;

    // Data, capability and agent of an interface; null (logged) when one cannot be made.
    static std::unique_ptr<Adapter> Create(const std::string& name);
    static int AddAdapter(const std::string& name);
    static int RemoveAdapter(const std::string& name);
    static List& GetList();
    static List::iterator FindAdapter(const std::string& name);
    static List::iterator FindAdapter(const vornwireless::utils::MacAddress& mac);
    static Adapter* GetAdapter(const std::string& name);
    static Adapter* GetPCIAdapter();
    static int GetEnabledAdapterCount();
    // Follows the system's "wlan" interfaces: 1 when the list changed, 0 when not, -1 on failure.
    static int RefreshAdapterList();
    // The wireless dongles the platform's hot-plug script reports under "/tmp/".
    static int GetDongleCount();

    // Every radio on (or off) without changing the stored configurations; -1 with no adapters.
    static int EnableAll();
    static int DisableAll();
    // The radio button: off when the built-in radio is on or coming on, else all on.
    static int SwitchOnOff();
    static int DeleteAdapterAll();
    // New agents for the current topology, brought up with the stored configurations.
    static int AddAgentAll();
    static int RestartService();
    static int SwitchKernelModule(WIFI_TOPOLOGY from, WIFI_TOPOLOGY to);
    static int SwitchNetTopology(WIFI_TOPOLOGY to);
    static int ResetToDefault();

    // The topology, read from the settings on first use and then kept for the process; a failed
    // read is not kept, so the next call reads again.
    static WIFI_TOPOLOGY GetTopology();
    static bool IsTopology(WIFI_TOPOLOGY topology) { return GetTopology() == topology; }
    // Sets the kept value; the stored settings are the caller's to write.
    static void SwitchTopology(WIFI_TOPOLOGY topology);
    // How long a newly loaded wifi driver is given before the interfaces are looked at.
    static void SetDriverSettleTime(std::chrono::milliseconds time);

    bool HasNullMember() const { return !agent_ || !data_ || !capability_; }
    const std::string& GetName() const;
    // Verifies, stores and writes config, then reloads what changed.
    int Apply(const AdapterConfig& config);
    int Initialize();
    int Terminate();
    WIFI_STATUS GetStatus() const;
    AdapterConfig GetConfig() const;
    // See AdapterData::Revision; 0 while the adapter has no data.
    std::uint64_t GetConfigRevision() const;
    const AdapterCapability* GetCapability() const { return capability_.get(); }
    int ScanNetworks(std::vector<AdapterConfig::StationInfo>& stations);
    int LoadStationConnData(std::vector<utils::ConnectionInfo>& connections);
    int EnableWPSWithPBC();
    int EnableWPSWithPinCode(const std::string& pin);
    // The hourly run: switches the networks to what the schedules say for local time now.
    int ExecSchedule();
    int ExecSchedule(const std::tm& now);

  private:
    int Switch(bool on);

    std::unique_ptr<AdapterAgent> agent_;
    std::unique_ptr<AdapterData> data_;
    std::unique_ptr<AdapterCapability> capability_;

    static std::mutex mutex_;
    static WIFI_TOPOLOGY topology_;
};

// The hour of the week a schedule flag stands for: Sunday 00:xx is 0, Saturday 23:xx is 167.
std::size_t ScheduleIndex(const std::tm& now);

}  // namespace wifi
}  // namespace vornwireless

#endif
