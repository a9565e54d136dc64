#include "wifi/adapter/adapter_agent.h"

#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"
#include "wifi/adapter/adapter_agent_client.h"
#include "wifi/adapter/adapter_agent_client_rlt.h"
#include "wifi/adapter/adapter_agent_hostapd_bridge.h"
#include "wifi/adapter/adapter_agent_hostapd_router.h"
#include "wifi/adapter/adapter_agent_rlt.h"
#include "wifi/settings/enum_map.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr const char* kRfkill = "/usr/vorn/sbin/rfkill";

}  // namespace

AdapterAgent::Kind AdapterAgent::Choose(const AdapterConfig& config, WIFI_TOPOLOGY topology) {
    if (config.driver != WIFI_DRIVER_NL80211) {
        VORN_LOG(LOG_ERR, "Not supported driver(%d)", static_cast<int>(config.driver));
        return Kind::kNone;
    }
    const bool rlt = utils::IsKiteBBuiltInWlan(config.name);
    switch (topology) {
        case WIFI_TOPOLOGY_ROUTER:
            return rlt ? Kind::kRLTRouter : Kind::kHostapdRouter;
        case WIFI_TOPOLOGY_CLIENT:
            return rlt ? Kind::kClientRLT : Kind::kClient;
        case WIFI_TOPOLOGY_BRIDGE:
            return rlt ? Kind::kRLTBridge : Kind::kHostapdBridge;
        default:
            break;
    }
    VORN_LOG(LOG_ERR, rlt ? "Failed to create rlt agent" : "Failed to create hostapd agent");
    return Kind::kNone;
}

AdapterAgent* AdapterAgent::Create(const AdapterConfig& config) {
    const Kind kind = Choose(config, Adapter::GetTopology());
    switch (kind) {
        case Kind::kHostapdRouter:
            return new AdapterAgentHostapdRouter(config.name);
        case Kind::kHostapdBridge:
            return new AdapterAgentHostapdBridge(config.name);
        case Kind::kClient:
            return new AdapterAgentClient(config.name);
        case Kind::kRLTRouter:
            return new AdapterAgentRLTRouter(config.name);
        case Kind::kRLTBridge:
            return new AdapterAgentRLTBridge(config.name);
        case Kind::kClientRLT:
            return new AdapterAgentClientRLT(config.name);
        case Kind::kNone:
            break;
    }
    return nullptr;
}

bool AdapterAgent::HasRadioSwitch() {
    return utils::IsKiteAModel() && QLIBCFileExist(kRfkill) == 1;
}

int AdapterAgent::SwitchRadio(const char* action) {
    return QLIBCExecl(kRfkill, QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT, action,
                      "wifi", nullptr);
}

int AdapterAgent::BlockRadioWhenUnused() const {
    if (Adapter::GetEnabledAdapterCount() != 0 || !HasRadioSwitch()) {
        return 0;
    }
    if (SwitchRadio("block") != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute rfkill block");
        return -1;
    }
    return 0;
}

bool AdapterAgent::IsNameValid() const {
    return vornwireless::utils::CheckInterfaceName(name_);
}

int AdapterAgent::Delete(const AdapterAgent* agent) {
    delete agent;
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
