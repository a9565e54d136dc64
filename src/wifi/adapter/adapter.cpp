#include "wifi/adapter/adapter.h"

#include <algorithm>
#include <csignal>
#include <thread>

#include "platform/qlibc_container.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/vorn_bridge.h"
#include "platform/vorn_net.h"
#include "platform/vorn_schedule.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "wifi/adapter/adapter_agent_ap.h"
#include "wifi/bridge/bridge_base.h"
#include "wifi/settings/enum_map.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr const char* kLockFile = "/tmp/topology.lock";
constexpr const char* kEventDaemonPidFile = "/var/run/evmond.pid";
constexpr const char* kDriverScript = "/lib/udev/script/usb-wifi-util.sh";
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT;
constexpr int kMaxInterfaces = 128;
constexpr int kMaxToolCopies = 130;
constexpr int kResumeTries = 8;

std::chrono::milliseconds driverSettleTime{3000};

// Names in dir beginning with prefix; none (logged) when dir cannot be listed.
bool ListDir(const char* dir, const char* prefix, int max, std::vector<std::string>& names) {
    QLIBSZLIST* list = nullptr;
    const int count = QLIBCFileEnumDir(dir, prefix, max, &list);
    for (int i = 0; i < count; ++i) {
        names.emplace_back(QLIBCSzListGet(list, i));
    }
    QLIBCSzListFree(list);
    return count >= 0;
}

int Run(const char* program, std::initializer_list<std::string> arguments) {
    std::vector<const char*> words(arguments.size() + 1, nullptr);
    std::transform(arguments.begin(), arguments.end(), words.begin(),
                   [](const std::string& word) { return word.c_str(); });
    switch (arguments.size()) {
        case 1:
            return QLIBCExecl(program, kExecFlags, words[0], nullptr);
        case 2:
            return QLIBCExecl(program, kExecFlags, words[0], words[1], nullptr);
        default:
            return -1;
    }
}

// The event daemon of the platform: frozen while the switch takes interfaces down and up.
// Without one there is nothing to freeze.
bool EventDaemonRuns() {
    return QLIBCProcAlive(QLIBCReadPidFile(kEventDaemonPidFile)) == 1;
}

int StopEventDaemon() {
    if (!EventDaemonRuns()) {
        VORN_LOG(LOG_INFO, "No event daemon to stop");
        return 0;
    }
    if (QLIBCProcSignalByPidFile(kEventDaemonPidFile, SIGSTOP) != 0) {
        VORN_LOG(LOG_ERR, "Failed to stop evmond");
        return -1;
    }
    return 0;
}

// Resumed whatever happened; a transient failure is retried with a growing pause, and a daemon
// that is gone needs no resume.
void ResumeEventDaemon() {
    std::chrono::milliseconds pause(10);
    for (int attempt = 0; attempt < kResumeTries && EventDaemonRuns(); ++attempt) {
        if (QLIBCProcSignalByPidFile(kEventDaemonPidFile, SIGCONT) == 0) {
            return;
        }
        VORN_LOG(LOG_ERR, "Failed to continue evmond");
        std::this_thread::sleep_for(pause);
        pause *= 4;
    }
}

// The interface name of a tool copy "vornwireless.IF", "" for other entries.
std::string ToolCopyInterface(const std::string& entry) {
    const std::string prefix = "vornwireless.";
    return entry.compare(0, prefix.size(), prefix) == 0 && entry != "vornwireless.pid"
               ? entry.substr(prefix.size())
               : "";
}

}  // namespace

std::mutex Adapter::mutex_;
WIFI_TOPOLOGY Adapter::topology_ = WIFI_TOPOLOGY_ERROR;

Adapter::Adapter(std::unique_ptr<AdapterAgent> agent, std::unique_ptr<AdapterData> data,
                 std::unique_ptr<AdapterCapability> capability)
    : agent_(std::move(agent)), data_(std::move(data)), capability_(std::move(capability)) {}

WIFI_TOPOLOGY Adapter::GetTopology() {
    if (topology_ == WIFI_TOPOLOGY_ERROR) {
        topology_ = utils::ReadTopology();
    }
    return topology_;
}

void Adapter::SwitchTopology(WIFI_TOPOLOGY topology) {
    topology_ = topology;
}

void Adapter::SetDriverSettleTime(std::chrono::milliseconds time) {
    driverSettleTime = time;
}

Adapter::List& Adapter::GetList() {
    static List list;
    return list;
}

std::unique_ptr<Adapter> Adapter::Create(const std::string& name) {
    // The name builds the settings' paths and reaches the agents' command lines.
    if (!vornwireless::utils::CheckInterfaceName(name)) {
        return nullptr;
    }
    if (GetTopology() == WIFI_TOPOLOGY_ERROR) {
        VORN_LOG(LOG_ERR, "Failed to read topology from vorninfo.conf");
        return nullptr;
    }
    std::unique_ptr<AdapterData> data(AdapterData::Create(name));
    if (!data) {
        VORN_LOG(LOG_ERR, "Failed to create data(%s)", name.c_str());
        return nullptr;
    }
    std::unique_ptr<AdapterCapability> capability(AdapterCapability::Create(name));
    if (!capability) {
        VORN_LOG(LOG_ERR, "Failed to create capability(%s)", name.c_str());
        return nullptr;
    }
    std::unique_ptr<AdapterAgent> agent(AdapterAgent::Create(data->GetConfig()));
    if (!agent) {
        VORN_LOG(LOG_ERR, "Failed to create agent(%s)", name.c_str());
        return nullptr;
    }
    return std::make_unique<Adapter>(std::move(agent), std::move(data), std::move(capability));
}

int Adapter::AddAdapter(const std::string& name) {
    if (GetAdapter(name) != nullptr) {
        VORN_LOG(LOG_ERR, "[%s] had been added", name.c_str());
        return -1;
    }
    std::unique_ptr<Adapter> adapter = Create(name);
    if (!adapter) {
        VORN_LOG(LOG_ERR, "Failed to add adapter(%s)", name.c_str());
        return -1;
    }
    if (adapter->Apply(adapter->GetConfig()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to apply agent(%s) when created, skip it", name.c_str());
    }
    GetList().push_back(std::move(adapter));
    return 0;
}

int Adapter::RemoveAdapter(const std::string& name) {
    const auto found = FindAdapter(name);
    if (found == GetList().end()) {
        VORN_LOG(LOG_ERR, "Failed to find adapter(%s)", name.c_str());
        return -1;
    }
    (*found)->Terminate();
    GetList().erase(found);
    return 0;
}

Adapter::List::iterator Adapter::FindAdapter(const std::string& name) {
    return std::find_if(GetList().begin(), GetList().end(),
                        [&](const auto& adapter) { return adapter->GetName() == name; });
}

Adapter::List::iterator Adapter::FindAdapter(const vornwireless::utils::MacAddress& mac) {
    return std::find_if(GetList().begin(), GetList().end(), [&](const auto& adapter) {
        return adapter->data_ && adapter->data_->GetConfig().bssid == mac;
    });
}

Adapter* Adapter::GetAdapter(const std::string& name) {
    const auto found = FindAdapter(name);
    return found == GetList().end() ? nullptr : found->get();
}

Adapter* Adapter::GetPCIAdapter() {
    for (const auto& adapter : GetList()) {
        if (adapter->data_ && adapter->data_->GetConfig().is_pci_interface) {
            return adapter.get();
        }
    }
    return nullptr;
}

int Adapter::GetEnabledAdapterCount() {
    return static_cast<int>(std::count_if(GetList().begin(), GetList().end(), [](const auto& a) {
        return a->data_ && a->data_->GetConfig().enabled;
    }));
}

int Adapter::GetDongleCount() {
    std::vector<std::string> entries;
    if (!ListDir("/tmp/", "wireless.info", kMaxInterfaces, entries)) {
        VORN_LOG(LOG_ERR, "Failed to enum all files under /tmp/wireless.info");
        return -1;
    }
    return static_cast<int>(entries.size());
}

int Adapter::RefreshAdapterList() {
    std::vector<std::string> names;
    if (!ListDir("/sys/class/net", "wlan", kMaxInterfaces, names)) {
        VORN_LOG(LOG_ERR, "Failed to enum wlan");
        return -1;
    }
    if (utils::SetSupportNetTopology(!names.empty()) != 0 ||
        utils::SetHasWifiDongle(GetDongleCount() >= 1) != 0) {
        return -1;
    }
    const std::size_t before = GetList().size();
    bool changed = false;
    for (const auto& name : names) {
        changed = (GetAdapter(name) == nullptr && AddAdapter(name) == 0) || changed;
    }
    if (GetList().size() != names.size()) {
        std::vector<std::string> gone;
        for (const auto& adapter : GetList()) {
            if (std::find(names.begin(), names.end(), adapter->GetName()) == names.end()) {
                gone.push_back(adapter->GetName());
            }
        }
        for (const auto& name : gone) {
            changed = RemoveAdapter(name) == 0 || changed;
        }
    }
    return changed || GetList().size() != before ? 1 : 0;
}

int Adapter::Switch(bool on) {
    if (HasNullMember()) {
        return -1;
    }
    AdapterConfig config = data_->GetConfig();
    config.enabled = on;
    config.client_enabled = on;
    return on ? agent_->Enable(config) : agent_->Disable(config);
}

int Adapter::EnableAll() {
    for (const auto& adapter : GetList()) {
        if (adapter->Switch(true) < 0) {
            VORN_LOG(LOG_ERR, "Failed to initialize");
        }
    }
    return GetList().empty() ? -1 : 0;
}

int Adapter::DisableAll() {
    for (const auto& adapter : GetList()) {
        if (adapter->Switch(false) < 0) {
            VORN_LOG(LOG_ERR, "Failed to terminate");
        }
    }
    return GetList().empty() ? -1 : 0;
}

int Adapter::SwitchOnOff() {
    const Adapter* pci = GetPCIAdapter();
    if (pci == nullptr) {
        return 0;
    }
    const WIFI_STATUS status = pci->GetStatus();
    return status == WIFI_STATUS_ENABLED || status == WIFI_STATUS_ENABLING ? DisableAll()
                                                                           : EnableAll();
}

int Adapter::DeleteAdapterAll() {
    for (const auto& adapter : GetList()) {
        if (adapter->Terminate() < 0) {
            VORN_LOG(LOG_ERR, "Failed to disable agent (%s)", adapter->GetName().c_str());
        }
    }
    std::lock_guard<std::mutex> lock(mutex_);
    for (const auto& adapter : GetList()) {
        adapter->agent_.reset();
        adapter->data_.reset();
        adapter->capability_.reset();
    }
    GetList().clear();
    return 0;
}

int Adapter::AddAgentAll() {
    int result = 0;
    for (const auto& adapter : GetList()) {
        adapter->agent_.reset(adapter->data_ ? AdapterAgent::Create(adapter->GetConfig())
                                             : nullptr);
        if (!adapter->agent_) {
            VORN_LOG(LOG_ERR, "Failed to create new agent (%s)", adapter->GetName().c_str());
            result = -1;
        }
    }
    for (const auto& adapter : GetList()) {
        if (adapter->Initialize() < 0) {
            VORN_LOG(LOG_ERR, "Failed to enable new agent (%s)", adapter->GetName().c_str());
            result = -1;
        }
    }
    return result;
}

int Adapter::RestartService() {
    int result = 0;
    if (VORNNetApplyPPPoERelayConfigAll() != 0) {
        VORN_LOG(LOG_ERR, "Failed to apply pppoe-relay config");
        result = -1;
    }
    if (Run("/usr/vorn/etc/rc.d/S98upnpd.sh", {"restart"}) != 0) {
        VORN_LOG(LOG_ERR, "Failed to apply UNnP config");
        result = -1;
    }
    if (QLIBNetService("network-services", "reload") != 0) {
        VORN_LOG(LOG_ERR, "Failed to reload network services");
        result = -1;
    }
    return result;
}

int Adapter::SwitchKernelModule(WIFI_TOPOLOGY from, WIFI_TOPOLOGY to) {
    // Topology strings are words of the enum map, safe on a shell line.
    for (const auto& step :
         {std::make_pair("unload-driver", from), std::make_pair("load-driver", to)}) {
        const std::string command = std::string(kDriverScript) + " " + step.first + " " +
                                    EnumMap<WIFI_TOPOLOGY>::EnumToString(step.second);
        if (QLIBCSystem(command.c_str()) != 0) {
            VORN_LOG(LOG_ERR, "Error on cmd [%s]", command.c_str());
            return -1;
        }
    }
    std::this_thread::sleep_for(driverSettleTime);
    return 0;
}

int Adapter::SwitchNetTopology(WIFI_TOPOLOGY to) {
    Run("/bin/touch", {vorn::platform::RootPath(kLockFile)});
    const WIFI_TOPOLOGY from = GetTopology();
    int result = -1;
    if (StopEventDaemon() != 0) {
    } else if (DeleteAdapterAll() != 0 || BridgeBase::DisableAll() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable bridges");
    } else if (BridgeBase::DisableTopologyAll() != 0) {
        VORN_LOG(LOG_ERR, "Failed to disable topology");
    } else if (SwitchKernelModule(from, to) != 0) {
        VORN_LOG(LOG_ERR, "Failed on switch kernel module");
    } else if (utils::WriteTopology(to) != 0) {
        VORN_LOG(LOG_ERR, "Failed to write topology to config");
    } else if (SwitchTopology(to), BridgeBase::SwitchTopology(to) != 0) {
        VORN_LOG(LOG_ERR, "Failed to switch bridge to topology [%d]", static_cast<int>(to));
    } else if (BridgeBase::EnableTopologyAll() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable topology");
    } else if (BridgeBase::EnableAll() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable bridges");
    } else if (RefreshAdapterList() < 0) {
        VORN_LOG(LOG_ERR, "Failed to refresh adapter list");
    } else {
        RestartService();
        VORNFwRuleHup();
        VORNFwTcRuleHup();
        if (Run("/usr/vorn/sbin/vornnetdtool", {"--refresh-gateway", "all"}) != 0) {
            VORN_LOG(LOG_DEBUG, "Failed to refresh default gateway");
        }
        result = 0;
    }
    ResumeEventDaemon();
    Run("/bin/rm", {vorn::platform::RootPath(kLockFile)});
    return result;
}

int Adapter::ResetToDefault() {
    for (const char* file :
         {"/usr/vorn/etc/rlt_wifi/rlt_wifi.conf", "/usr/vorn/etc/rlt_wifi/rlt_wifi_sta.conf",
          "/usr/vorn/etc/wifi/wifi_client_obsolete"}) {
        QLIBCSysUnlink(file);
    }
    std::vector<std::string> settings;
    ListDir("/usr/vorn/etc/wifi", "wifi_ap_", kMaxInterfaces, settings);
    ListDir("/usr/vorn/etc/wifi", "wifi_client_", kMaxInterfaces, settings);
    for (const auto& name : settings) {
        QLIBCSysUnlink(("/usr/vorn/etc/wifi/" + name).c_str());
    }
    std::vector<std::string> entries;
    if (!ListDir("/tmp/", "vornwireless", kMaxToolCopies, entries)) {
        VORN_LOG(LOG_ERR, "Failed to find %s in %s", "vornwireless", "/tmp/");
        return -1;
    }
    int result = 0;
    for (const auto& entry : entries) {
        const std::string ifname = ToolCopyInterface(entry);
        if (ifname.empty()) {
            continue;
        }
        if (VORNScheduleRemove(AdapterAgentAP::ScheduleCommand(ifname).c_str()) != 0) {
            VORN_LOG(LOG_ERR, "Failed to disable wifi scheduler\n");
            result = -1;
        }
        const std::string path = "/tmp/" + entry;
        if (Run("/bin/rm", {"-f", vorn::platform::RootPath(path)}) != 0) {
            VORN_LOG(LOG_ERR, "Failed to remove %s", path.c_str());
            result = -1;
        }
    }
    return result;
}

const std::string& Adapter::GetName() const {
    static const std::string none;
    return data_ ? data_->GetConfig().name : none;
}

int Adapter::Apply(const AdapterConfig& config) {
    std::lock_guard<std::mutex> lock(mutex_);
    if (HasNullMember()) {
        VORN_LOG(LOG_ERR, "Bad member(%p, %p, %p)", static_cast<void*>(data_.get()),
                 static_cast<void*>(capability_.get()), static_cast<void*>(agent_.get()));
        return -1;
    }
    if (capability_->Verify(config) < 0) {
        VORN_LOG(LOG_ERR, "Bad config");
        return -1;
    }
    if (data_->SetConfig(config) < 0) {
        VORN_LOG(LOG_ERR, "Failed to set config");
        return -1;
    }
    if (data_->Write() < 0) {
        VORN_LOG(LOG_ERR, "Failed to write config");
        return -1;
    }
    if (agent_->Reload(data_->GetConfig(), data_->GetReloadStatus()) < 0) {
        VORN_LOG(LOG_ERR, "Failed to apply new config");
        return -1;
    }
    data_->ResetReloadStatus();
    return 0;
}

int Adapter::Initialize() {
    return HasNullMember() ? -1 : agent_->Recover(data_->GetConfig());
}

int Adapter::Terminate() {
    return agent_ && data_ ? agent_->Disable(data_->GetConfig()) : 0;
}

WIFI_STATUS Adapter::GetStatus() const {
    return HasNullMember() ? WIFI_STATUS_ERROR : agent_->GetStatus(data_->GetConfig());
}

AdapterConfig Adapter::GetConfig() const {
    return data_ ? data_->GetConfig() : AdapterConfig();
}

std::uint64_t Adapter::GetConfigRevision() const {
    return data_ ? data_->Revision() : 0;
}

int Adapter::ScanNetworks(std::vector<AdapterConfig::StationInfo>& stations) {
    return HasNullMember() ? -1 : agent_->ScanNetworks(data_->GetConfig(), stations);
}

int Adapter::LoadStationConnData(std::vector<utils::ConnectionInfo>& connections) {
    return agent_ ? agent_->LoadStationConnData(connections) : -1;
}

int Adapter::EnableWPSWithPBC() {
    return agent_ ? agent_->EnableWPSWithPBC() : -1;
}

int Adapter::EnableWPSWithPinCode(const std::string& pin) {
    return agent_ ? agent_->EnableWPSWithPinCode(pin) : -1;
}

std::size_t ScheduleIndex(const std::tm& now) {
    return static_cast<std::size_t>(now.tm_wday) * 24 + static_cast<std::size_t>(now.tm_hour);
}

int Adapter::ExecSchedule() {
    const std::time_t now = std::time(nullptr);
    std::tm local{};
    localtime_r(&now, &local);
    return ExecSchedule(local);
}

int Adapter::ExecSchedule(const std::tm& now) {
    if (HasNullMember()) {
        VORN_LOG(LOG_ERR, "Bad member(%p, %p, %p)", static_cast<void*>(data_.get()),
                 static_cast<void*>(capability_.get()), static_cast<void*>(agent_.get()));
        return -1;
    }
    if (!IsTopology(WIFI_TOPOLOGY_BRIDGE) && !IsTopology(WIFI_TOPOLOGY_ROUTER)) {
        VORN_LOG(LOG_ERR, "Schedule function should only execute in router or bridge mode");
        return -1;
    }
    AdapterConfig config = data_->GetConfig();
    if (!config.schedule_enabled && !config.guest_schedule_enabled) {
        VORN_LOG(LOG_ERR, "Adapter [%s]'s schedule is not enabled, but still executed",
                 config.name.c_str());
        return -1;
    }
    const std::size_t index = ScheduleIndex(now);
    bool changed = false;
    if (config.schedule_enabled) {
        changed = SetReloadData(config.enabled, config.schedule[index]) || changed;
    }
    if (config.guest_schedule_enabled) {
        changed = SetReloadData(config.guest_enabled, config.guest_schedule[index]) || changed;
    }
    if (changed && Apply(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to apply config for schedule");
        return -1;
    }
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
